package android.content;

import android.content.res.AssetManager;
import android.content.res.Resources;
import java.io.File;
import java.util.Map;

public abstract class Context {
    public static String standInPackage;
    public static File standInCache;
    public static Map<Integer, String> standInStrings;

    public AssetManager getAssets() {
        return new AssetManager(standInPackage);
    }

    public Resources getResources() {
        return new Resources();
    }

    public File getCacheDir() {
        return standInCache;
    }

    public ContentResolver getContentResolver() {
        return new ContentResolver() {};
    }

    public final String getString(int id) {
        return standInStrings.get(id);
    }

    public final String getString(int id, Object... values) {
        return String.format(standInStrings.get(id), values);
    }
}
