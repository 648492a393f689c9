package android.view;

public final class MotionEvent {
    public static final int ACTION_DOWN = 0;
    public static final int ACTION_UP = 1;
    public static final int ACTION_MOVE = 2;
    public static final int ACTION_CANCEL = 3;
    public static final int ACTION_POINTER_DOWN = 5;
    public static final int ACTION_POINTER_UP = 6;

    private final int action;
    private final long time;
    private final float[] places;

    private MotionEvent(int action, long time, float... places) {
        this.action = action;
        this.time = time;
        this.places = places;
    }

    /** @param places x and y of each finger, one after the other */
    public static MotionEvent standIn(int action, long time, float... places) {
        return new MotionEvent(action, time, places);
    }

    public final int getActionMasked() {
        return action;
    }

    public final int getPointerCount() {
        return places.length / 2;
    }

    public final float getX(int finger) {
        return places[2 * finger];
    }

    public final float getY(int finger) {
        return places[2 * finger + 1];
    }

    public final long getEventTime() {
        return time;
    }
}
