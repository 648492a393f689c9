package android.view;

import android.content.Context;
import java.util.ArrayList;
import java.util.List;

public abstract class ViewGroup extends View {
    public static class LayoutParams {
        public static final int MATCH_PARENT = -1;
        public static final int WRAP_CONTENT = -2;
    }

    public final List<View> standInChildren = new ArrayList<>();

    public ViewGroup(Context context) {
        super(context);
    }

    public void addView(View child) {
        standInChildren.add(child);
    }

    public void addView(View child, LayoutParams parameters) {
        standInChildren.add(child);
    }
}
