package android.view;

public class Gravity {
    public static final int TOP = 48;
    public static final int BOTTOM = 80;
    public static final int CENTER = 17;
}
