package orv.viewer;

import android.view.MotionEvent;

/** Gestures: one finger turns, two move and pinch, a double tap resets the view. */
final class Gestures {
    interface Hand {
        /** In density-independent pixels. */
        void turn(float right, float down);

        /** In pixels. */
        void pan(float right, float down);

        /** The factor of the zoom. */
        void zoom(float factor);

        void reset();
    }

    // In density-independent pixels.
    private static final float SLOP = 8; // a resting finger moves up to this far
    private static final float TAP_DISTANCE = 40;
    private static final long TAP_MS = 300;

    private final Hand hand;
    private final float density; // pixels in a density-independent one
    private int followed; // the number of fingers that x, y and span belong to; 0 if they are unknown
    private float x;
    private float y;
    private float span;
    private boolean isTap;
    private float downX;
    private float downY;
    private long downTime;
    private float tapX;
    private float tapY;
    private long tapTime = Long.MIN_VALUE / 2;

    Gestures(Hand hand, float density) {
        this.hand = hand;
        this.density = density;
    }

    void follow(MotionEvent event) {
        switch (event.getActionMasked()) {
            case MotionEvent.ACTION_DOWN:
                isTap = true;
                downX = event.getX(0);
                downY = event.getY(0);
                downTime = event.getEventTime();
                followed = 0;
                break;
            case MotionEvent.ACTION_MOVE:
                move(event);
                break;
            case MotionEvent.ACTION_UP:
                if (isTap && event.getEventTime() - downTime < TAP_MS) {
                    tap(event.getEventTime());
                }
                followed = 0;
                break;
            default: // another finger came or went, or the gesture was cancelled
                isTap = false;
                followed = 0;
                break;
        }
    }

    private void move(MotionEvent event) {
        boolean isOne = event.getPointerCount() == 1;
        float oldX = x;
        float oldY = y;
        float oldSpan = span;
        int before = followed;
        if (isOne && isTap) {
            if (distance(event.getX(0), event.getY(0), downX, downY) < SLOP) {
                return;
            }
            isTap = false;
        }
        place(event, isOne);
        if (before != followed) {
            return; // the first positions of these fingers
        }
        if (isOne) {
            hand.turn((x - oldX) / density, (y - oldY) / density);
            return;
        }
        hand.pan(x - oldX, y - oldY);
        if (span > 0 && oldSpan > 0) {
            hand.zoom(span / oldSpan);
        }
    }

    private void place(MotionEvent event, boolean isOne) {
        int other = isOne ? 0 : 1;
        x = (event.getX(0) + event.getX(other)) / 2;
        y = (event.getY(0) + event.getY(other)) / 2;
        span = distance(event.getX(0), event.getY(0), event.getX(other), event.getY(other));
        followed = isOne ? 1 : 2;
    }

    private void tap(long time) {
        if (time - tapTime < TAP_MS && distance(downX, downY, tapX, tapY) < TAP_DISTANCE) {
            tapTime = Long.MIN_VALUE / 2;
            hand.reset();
            return;
        }
        tapX = downX;
        tapY = downY;
        tapTime = time;
    }

    private float distance(float oneX, float oneY, float otherX, float otherY) {
        return (float) Math.hypot(oneX - otherX, oneY - otherY) / density;
    }
}
