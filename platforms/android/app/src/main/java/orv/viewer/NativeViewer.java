package orv.viewer;

import android.content.res.AssetManager;
import java.nio.charset.StandardCharsets;

/**
 * The native viewer, which takes one call at a time. Call {@link #replaceContext}, {@link #open} and {@link #draw} on the
 * thread whose GL context is current, the others on any thread. After {@link #release}, which may be called at any time,
 * all calls do nothing.
 */
final class NativeViewer {
    static {
        System.loadLibrary("orvviewer");
    }

    private long handle;

    NativeViewer(AssetManager assets) {
        handle = create(assets);
    }

    /** A new context is current, and the old one is lost: loads the scene again. */
    synchronized boolean replaceContext() {
        return replaceContext(handle);
    }

    /** Sets the size of the surface, in pixels. */
    synchronized void setSize(int width, int height) {
        setSize(handle, width, height);
    }

    /** Advances the time and draws. Returns whether the next frame would differ. */
    synchronized boolean draw(float seconds) {
        return draw(handle, seconds);
    }

    /** Shows a file, or an asset of the package. Returns false if it cannot be loaded. */
    synchronized boolean open(Shown shown) {
        return open(handle, shown.path.getBytes(StandardCharsets.UTF_8), shown.isAsset);
    }

    synchronized boolean isOpen() {
        return isOpen(handle);
    }

    /** The errors of the last load, one a line; empty for none. */
    synchronized String getMessage() {
        byte[] text = getMessage(handle);
        return text == null ? "" : new String(text, StandardCharsets.UTF_8);
    }

    /** Turns the view, half a degree for each density-independent pixel. */
    synchronized void turn(float right, float down) {
        turn(handle, right, down);
    }

    /** Moves the view, in pixels. */
    synchronized void pan(float right, float down) {
        pan(handle, right, down);
    }

    /** Zooms by a factor: above 1, things get larger. */
    synchronized void zoom(float factor) {
        zoom(handle, factor);
    }

    /** Shows the whole scene, from the front. */
    synchronized void frameAll() {
        frameAll(handle);
    }

    synchronized int getCameraCount() {
        return getCameraCount(handle);
    }

    synchronized void stepCamera() {
        stepCamera(handle);
    }

    synchronized int getClipCount() {
        return getClipCount(handle);
    }

    synchronized void stepClip() {
        stepClip(handle);
    }

    synchronized void togglePaused() {
        togglePaused(handle);
    }

    /** Returns true as well if there is nothing to play. */
    synchronized boolean isPaused() {
        return isPaused(handle);
    }

    /** Makes no GL call: GL objects are deleted together with their context. */
    synchronized void release() {
        destroy(handle);
        handle = 0;
    }

    private static native long create(AssetManager assets);

    private static native void destroy(long handle);

    private static native boolean replaceContext(long handle);

    private static native void setSize(long handle, int width, int height);

    private static native boolean draw(long handle, float seconds);

    private static native boolean open(long handle, byte[] path, boolean isAsset);

    private static native boolean isOpen(long handle);

    private static native byte[] getMessage(long handle);

    private static native void turn(long handle, float right, float down);

    private static native void pan(long handle, float right, float down);

    private static native void zoom(long handle, float factor);

    private static native void frameAll(long handle);

    private static native int getCameraCount(long handle);

    private static native void stepCamera(long handle);

    private static native int getClipCount(long handle);

    private static native void stepClip(long handle);

    private static native void togglePaused(long handle);

    private static native boolean isPaused(long handle);
}
