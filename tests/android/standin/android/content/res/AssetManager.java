package android.content.res;

public final class AssetManager {
    public final String standInPackage; // read by native/libandroid.cpp

    public AssetManager(String standInPackage) {
        this.standInPackage = standInPackage;
    }
}
