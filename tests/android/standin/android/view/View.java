package android.view;

import android.content.Context;
import standin.MainThread;

public class View {
    public static final int VISIBLE = 0;
    public static final int GONE = 8;
    public static final int ACCESSIBILITY_LIVE_REGION_POLITE = 1;

    public interface OnClickListener {
        void onClick(View view);
    }

    public volatile int standInVisibility;
    public volatile CharSequence standInDescription;
    private OnClickListener listener;

    public View(Context context) {}

    public void setVisibility(int visibility) {
        standInVisibility = visibility;
    }

    public void setBackgroundColor(int colour) {}

    public void setPadding(int left, int top, int right, int bottom) {}

    public void setFitsSystemWindows(boolean fits) {}

    public void setContentDescription(CharSequence text) {
        standInDescription = text;
    }

    public void setAccessibilityLiveRegion(int mode) {}

    public void setOnClickListener(OnClickListener listener) {
        this.listener = listener;
    }

    public boolean onTouchEvent(MotionEvent event) {
        return false;
    }

    public boolean post(Runnable what) {
        MainThread.post(what);
        return true;
    }

    public void standInClick() {
        listener.onClick(this);
    }
}
