package android.opengl;

import android.content.Context;
import android.view.SurfaceView;
import java.util.ArrayDeque;
import java.util.Queue;
import javax.microedition.khronos.egl.EGLConfig;
import javax.microedition.khronos.opengles.GL10;
import standin.Gl;

/**
 * Does what Android's documentation says of it: one thread draws; events run before frames, also without a context; a context
 * that is not preserved is lost when the application pauses; after each new context, onSurfaceCreated() and then
 * onSurfaceChanged() are called.
 */
public class GLSurfaceView extends SurfaceView {
    public static final int RENDERMODE_WHEN_DIRTY = 0;

    public interface Renderer {
        void onSurfaceCreated(GL10 unused, EGLConfig config);

        void onSurfaceChanged(GL10 unused, int width, int height);

        void onDrawFrame(GL10 unused);
    }

    public static final int STAND_IN_WIDTH = 320;
    public static final int STAND_IN_HEIGHT = 240;

    /** Whether the device drops contexts although the application asks to preserve them. */
    public static volatile boolean standInLosesContexts;

    private final Queue<Runnable> events = new ArrayDeque<>();
    private Renderer renderer;
    private Thread thread;
    private boolean preserves;
    private boolean isPaused;
    private boolean isAtRest; // the thread has seen isPaused
    private boolean isEnding;
    private boolean isWanted;
    private boolean isBusy;
    private long context;
    private int frames;
    private int contexts;
    private byte[] picture;
    private Throwable failure;

    public GLSurfaceView(Context context) {
        super(context);
    }

    public void setEGLContextClientVersion(int version) {
        if (version != 2) {
            throw new IllegalArgumentException("version " + version);
        }
    }

    public void setEGLConfigChooser(int red, int green, int blue, int alpha, int depth, int stencil) {}

    public void setPreserveEGLContextOnPause(boolean preserves) {
        this.preserves = preserves;
    }

    public void setRenderer(Renderer renderer) {
        this.renderer = renderer;
        thread = new Thread(this::loop, "GL");
        thread.start();
    }

    public void setRenderMode(int mode) {
        if (mode != RENDERMODE_WHEN_DIRTY) {
            throw new IllegalArgumentException("mode " + mode);
        }
    }

    public synchronized void requestRender() {
        isWanted = true;
        notifyAll();
    }

    public synchronized void queueEvent(Runnable event) {
        events.add(event);
        notifyAll();
    }

    public synchronized void onPause() {
        isPaused = true;
        isAtRest = false;
        notifyAll();
        await(() -> isAtRest || !thread.isAlive());
    }

    public synchronized void onResume() {
        isPaused = false;
        isWanted = true;
        notifyAll();
    }

    /** What the system does when the window is gone. */
    public void standInDetach() throws InterruptedException {
        synchronized (this) {
            isEnding = true;
            notifyAll();
        }
        thread.join(300_000);
        if (thread.isAlive()) {
            throw new IllegalStateException("the GL thread goes on");
        }
    }

    /** Waits until nothing is left to do, at the most a number of frames. Returns the last picture: RGBA, from the top. */
    public synchronized byte[] standInPicture(int most) {
        int last = frames + most;
        await(() -> failure != null || frames >= last || (events.isEmpty() && !isBusy && (isPaused || !isWanted)));
        if (failure != null) {
            throw new IllegalStateException(failure);
        }
        return picture;
    }

    public synchronized int standInFrames() {
        return frames;
    }

    public synchronized int standInContexts() {
        return contexts;
    }

    private interface Condition {
        boolean holds();
    }

    private void await(Condition condition) {
        long end = System.nanoTime() + 300_000_000_000L;
        try {
            while (!condition.holds()) {
                if (System.nanoTime() > end) {
                    throw new IllegalStateException("waited too long");
                }
                wait(1000);
            }
        } catch (InterruptedException unexpected) {
            throw new IllegalStateException(unexpected);
        }
    }

    private void loop() {
        try {
            while (step()) {}
        } catch (Throwable thrown) {
            synchronized (this) {
                failure = thrown;
                notifyAll();
            }
        }
        dropContext();
    }

    private boolean step() throws InterruptedException {
        Runnable event;
        synchronized (this) {
            isBusy = false;
            notifyAll();
            while (!isEnding && events.isEmpty() && !(isPaused && !isAtRest) && !(!isPaused && isWanted)) {
                wait();
            }
            if (isEnding) {
                return false;
            }
            isBusy = true;
            event = events.poll();
            if (event == null && isPaused) {
                Gl.makeNoneCurrent();
                if (!preserves || standInLosesContexts) {
                    dropContext();
                }
                isAtRest = true;
                return true;
            }
            if (event == null) {
                isWanted = false;
            }
        }
        if (event != null) {
            event.run();
        } else {
            drawFrame();
        }
        return true;
    }

    private void drawFrame() {
        if (context == 0) {
            context = Gl.make(STAND_IN_WIDTH, STAND_IN_HEIGHT);
            synchronized (this) {
                ++contexts;
            }
            renderer.onSurfaceCreated(null, null);
            renderer.onSurfaceChanged(null, STAND_IN_WIDTH, STAND_IN_HEIGHT);
        } else if (!Gl.makeCurrent(context)) {
            throw new IllegalStateException("the context cannot be made current");
        }
        renderer.onDrawFrame(null);
        byte[] pixels = Gl.read(context);
        synchronized (this) {
            picture = pixels;
            ++frames;
        }
    }

    private void dropContext() {
        if (context != 0) {
            Gl.destroy(context);
            context = 0;
        }
    }
}
