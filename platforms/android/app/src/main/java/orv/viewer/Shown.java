package orv.viewer;

/** A file, by its path, or an asset of the package, by its name. */
final class Shown {
    final String path;
    final boolean isAsset;

    Shown(String path, boolean isAsset) {
        this.path = path;
        this.isAsset = isAsset;
    }
}
