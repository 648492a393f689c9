package orv.viewer;

import android.content.Context;
import android.opengl.GLSurfaceView;
import android.view.MotionEvent;
import javax.microedition.khronos.egl.EGLConfig;
import javax.microedition.khronos.opengles.GL10;

/**
 * The scene on the screen. All work is done on its GL thread. Drawing and loading wait for {@link #onDrawFrame}, where a
 * context is current: while the application is paused, events run without one.
 */
final class ViewerView extends GLSurfaceView implements GLSurfaceView.Renderer, Gestures.Hand {
    /** Receives changes, on the user interface's thread. */
    interface Listener {
        /** A scene was loaded, or could not be. */
        void onLoaded(boolean isOpen, String message, int clips, int cameras);

        void onPaused(boolean isPaused);
    }

    private final NativeViewer viewer;
    private final Listener listener;
    private final Gestures gestures;
    private Shown wish; // to be loaded at the next frame
    private long lastFrame; // in nanoseconds; 0 to start timing again
    private boolean wasPaused;

    ViewerView(Context context, Listener listener) {
        super(context);
        this.listener = listener;
        viewer = new NativeViewer(context.getAssets());
        gestures = new Gestures(this, context.getResources().getDisplayMetrics().density);
        setEGLContextClientVersion(2);
        setEGLConfigChooser(8, 8, 8, 0, 16, 8);
        setPreserveEGLContextOnPause(true); // if the device cannot, everything is loaded again
        setRenderer(this);
        setRenderMode(RENDERMODE_WHEN_DIRTY);
    }

    void show(Shown shown) {
        change(() -> wish = shown);
    }

    void togglePaused() {
        change(viewer::togglePaused);
    }

    void stepClip() {
        change(viewer::stepClip);
    }

    void stepCamera() {
        change(viewer::stepCamera);
    }

    /** To be called at the end of the activity, when the GL thread is paused or has ended. */
    void release() {
        viewer.release();
    }

    @Override
    public void onResume() {
        super.onResume();
        change(() -> lastFrame = 0);
    }

    @Override
    public boolean onTouchEvent(MotionEvent event) {
        gestures.follow(event);
        return true;
    }

    @Override
    public void turn(float right, float down) {
        change(() -> viewer.turn(right, down));
    }

    @Override
    public void pan(float right, float down) {
        change(() -> viewer.pan(right, down));
    }

    @Override
    public void zoom(float factor) {
        change(() -> viewer.zoom(factor));
    }

    @Override
    public void reset() {
        change(viewer::frameAll);
    }

    @Override
    public void onSurfaceCreated(GL10 unused, EGLConfig config) {
        lastFrame = 0;
        if (!viewer.replaceContext()) {
            tellLoaded();
        }
    }

    @Override
    public void onSurfaceChanged(GL10 unused, int width, int height) {
        viewer.setSize(width, height);
    }

    @Override
    public void onDrawFrame(GL10 unused) {
        if (wish != null) {
            viewer.open(wish);
            wish = null;
            lastFrame = 0;
            tellLoaded();
        }
        long now = System.nanoTime();
        boolean moves = viewer.draw(lastFrame == 0 ? 0 : (now - lastFrame) * 1e-9f);
        lastFrame = moves ? now : 0;
        tellPaused();
        if (moves) {
            requestRender();
        }
    }

    private void change(Runnable what) {
        queueEvent(what);
        requestRender();
    }

    private void tellLoaded() {
        boolean isOpen = viewer.isOpen();
        String message = viewer.getMessage();
        int clips = viewer.getClipCount();
        int cameras = viewer.getCameraCount();
        wasPaused = viewer.isPaused();
        boolean isPaused = wasPaused;
        post(() -> {
            listener.onLoaded(isOpen, message, clips, cameras);
            listener.onPaused(isPaused);
        });
    }

    private void tellPaused() {
        boolean isPaused = viewer.isPaused();
        if (isPaused != wasPaused) {
            wasPaused = isPaused;
            post(() -> listener.onPaused(isPaused));
        }
    }
}
