package android.content;

import android.net.Uri;
import java.util.ArrayList;
import java.util.List;

public class ClipData {
    public final List<Item> standInItems = new ArrayList<>();

    public int getItemCount() {
        return standInItems.size();
    }

    public Item getItemAt(int index) {
        return standInItems.get(index);
    }

    public static class Item {
        private final Uri uri;

        public Item(Uri uri) {
            this.uri = uri;
        }

        public Uri getUri() {
            return uri;
        }
    }
}
