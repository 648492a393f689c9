package android.content;

import android.database.Cursor;
import android.net.Uri;
import java.io.ByteArrayInputStream;
import java.io.FileNotFoundException;
import java.io.InputStream;
import java.util.HashMap;
import java.util.Map;

public abstract class ContentResolver {
    /** A file of another application: its content, or null if the application throws, and the name that it gives. */
    public static final class StandInFile {
        public final String name;
        public final byte[] content;

        public StandInFile(String name, byte[] content) {
            this.name = name;
            this.content = content;
        }
    }

    public static final Map<String, StandInFile> STAND_IN_FILES = new HashMap<>();

    public final InputStream openInputStream(Uri uri) throws FileNotFoundException {
        StandInFile file = STAND_IN_FILES.get(uri.toString());
        if (file == null) {
            throw new FileNotFoundException("gone: " + uri);
        }
        if (file.content == null) {
            throw new IllegalStateException("not now");
        }
        return new ByteArrayInputStream(file.content);
    }

    public final Cursor query(Uri uri, String[] columns, String selection, String[] arguments, String order) {
        StandInFile file = STAND_IN_FILES.get(uri.toString());
        if (file == null) {
            throw new SecurityException("no permission for " + uri);
        }
        return file.name == null ? null : new Cursor() {
            @Override
            public boolean moveToFirst() {
                return true;
            }

            @Override
            public String getString(int column) {
                return file.name;
            }

            @Override
            public void close() {}
        };
    }
}
