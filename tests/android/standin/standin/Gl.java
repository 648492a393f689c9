package standin;

/** OpenGL ES without a window; see native/standin.cpp. */
public final class Gl {
    static {
        System.loadLibrary("standin");
    }

    public static native long make(int width, int height);

    public static native void destroy(long context);

    public static native boolean makeCurrent(long context);

    public static native void makeNoneCurrent();

    public static native byte[] read(long context);

    public static native int countOpenAssets();

    private Gl() {}
}
