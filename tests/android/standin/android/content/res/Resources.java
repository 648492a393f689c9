package android.content.res;

import android.util.DisplayMetrics;

public class Resources {
    public DisplayMetrics getDisplayMetrics() {
        DisplayMetrics metrics = new DisplayMetrics();
        metrics.density = 2;
        return metrics;
    }
}
