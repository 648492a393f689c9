package android.net;

import java.net.URI;

public abstract class Uri {
    public abstract String getScheme();

    public abstract String getLastPathSegment();

    public static Uri parse(String text) {
        URI uri = URI.create(text);
        return new Uri() {
            @Override
            public String getScheme() {
                return uri.getScheme();
            }

            @Override
            public String getLastPathSegment() {
                String path = uri.getRawPath(); // what is escaped in it separates nothing
                return java.net.URLDecoder.decode(
                        path.substring(path.lastIndexOf('/') + 1), java.nio.charset.StandardCharsets.UTF_8);
            }

            @Override
            public String toString() {
                return text;
            }
        };
    }
}
