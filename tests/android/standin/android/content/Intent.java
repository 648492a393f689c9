package android.content;

import android.net.Uri;

public class Intent {
    public static final String ACTION_OPEN_DOCUMENT = "android.intent.action.OPEN_DOCUMENT";
    public static final String CATEGORY_OPENABLE = "android.intent.category.OPENABLE";
    public static final String EXTRA_ALLOW_MULTIPLE = "android.intent.extra.ALLOW_MULTIPLE";

    public final String standInAction;
    public Uri standInData;
    public ClipData standInSeveral;

    public Intent(String action) {
        standInAction = action;
    }

    public Intent addCategory(String category) {
        return this;
    }

    public Intent setType(String type) {
        return this;
    }

    public Intent putExtra(String name, boolean value) {
        return this;
    }

    public Uri getData() {
        return standInData;
    }

    public ClipData getClipData() {
        return standInSeveral;
    }
}
