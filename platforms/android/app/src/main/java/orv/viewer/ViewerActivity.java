package orv.viewer;

import android.app.Activity;
import android.content.ActivityNotFoundException;
import android.content.ClipData;
import android.content.Intent;
import android.net.Uri;
import android.os.Bundle;
import android.view.Gravity;
import android.view.View;
import android.view.ViewGroup;
import android.widget.Button;
import android.widget.FrameLayout;
import android.widget.LinearLayout;
import android.widget.TextView;
import java.io.File;
import java.io.IOException;
import java.util.ArrayList;
import java.util.List;

/** The application: a scene, with buttons at the bottom and a message over it if something is wrong. */
public final class ViewerActivity extends Activity implements ViewerView.Listener {
    private static final int CHOOSE = 1;
    private static final String PATH = "path";
    private static final String IS_ASSET = "isAsset";
    private static final Shown FIRST = new Shown("windmill.glo", true);

    private ViewerView view;
    private TextView message;
    private Button play;
    private Button clip;
    private Button camera;
    private Shown shown;

    @Override
    protected void onCreate(Bundle state) {
        super.onCreate(state);
        FrameLayout root = new FrameLayout(this);
        message = new TextView(this);
        message.setBackgroundColor(0xE0FFFFFF);
        message.setTextColor(0xFF202020);
        message.setPadding(24, 24, 24, 24);
        message.setVisibility(View.GONE);
        message.setAccessibilityLiveRegion(View.ACCESSIBILITY_LIVE_REGION_POLITE); // screen readers say new text
        try {
            view = new ViewerView(this, this);
        } catch (LinkageError reason) { // UnsatisfiedLinkError at first, NoClassDefFoundError from then on
            say(getString(R.string.no_library) + " " + reason.getMessage());
        }
        if (view != null) {
            root.addView(view);
        }
        FrameLayout overlay = new FrameLayout(this);
        overlay.setFitsSystemWindows(true); // otherwise the system's bars would cover parts of it
        overlay.addView(message, place(Gravity.TOP));
        overlay.addView(makeBar(), place(Gravity.BOTTOM));
        root.addView(overlay);
        setContentView(root);
        if (state != null && state.getString(PATH) != null) {
            show(new Shown(state.getString(PATH), state.getBoolean(IS_ASSET)));
        } else if (!openFrom(getIntent())) {
            show(FIRST);
        }
    }

    @Override
    protected void onNewIntent(Intent intent) {
        super.onNewIntent(intent);
        openFrom(intent);
    }

    @Override
    protected void onPause() {
        super.onPause();
        if (view != null) {
            view.onPause();
        }
    }

    @Override
    protected void onResume() {
        super.onResume();
        if (view != null) {
            view.onResume();
        }
    }

    @Override
    protected void onSaveInstanceState(Bundle state) {
        super.onSaveInstanceState(state);
        if (shown != null) {
            state.putString(PATH, shown.path);
            state.putBoolean(IS_ASSET, shown.isAsset);
        }
    }

    @Override
    protected void onDestroy() {
        if (view != null) {
            view.release();
        }
        super.onDestroy();
    }

    @Override
    protected void onActivityResult(int request, int result, Intent answer) {
        super.onActivityResult(request, result, answer);
        if (request == CHOOSE && result == RESULT_OK) {
            openFrom(answer);
        }
    }

    @Override
    public void onLoaded(boolean isOpen, String text, int clips, int cameras) {
        say(text);
        play.setVisibility(isOpen ? View.VISIBLE : View.GONE);
        clip.setVisibility(clips > 1 ? View.VISIBLE : View.GONE);
        camera.setVisibility(cameras > 0 ? View.VISIBLE : View.GONE);
        String name = shown == null ? "" : new File(shown.path).getName();
        view.setContentDescription(isOpen ? getString(R.string.shows, name) : text);
    }

    @Override
    public void onPaused(boolean isPaused) {
        play.setText(isPaused ? R.string.play : R.string.pause);
    }

    private View makeBar() {
        LinearLayout bar = new LinearLayout(this);
        bar.setGravity(Gravity.CENTER);
        addButton(bar, R.string.open, this::choose);
        play = addButton(bar, R.string.pause, () -> view.togglePaused());
        clip = addButton(bar, R.string.clip, () -> view.stepClip());
        camera = addButton(bar, R.string.camera, () -> view.stepCamera());
        for (Button button : new Button[] {play, clip, camera}) {
            button.setVisibility(View.GONE);
        }
        return bar;
    }

    private Button addButton(LinearLayout bar, int text, Runnable action) {
        Button button = new Button(this);
        button.setText(text);
        button.setOnClickListener(pressed -> action.run());
        bar.addView(button);
        return button;
    }

    private static FrameLayout.LayoutParams place(int gravity) {
        return new FrameLayout.LayoutParams(
                ViewGroup.LayoutParams.MATCH_PARENT, ViewGroup.LayoutParams.WRAP_CONTENT, gravity);
    }

    private void choose() {
        Intent question = new Intent(Intent.ACTION_OPEN_DOCUMENT);
        question.addCategory(Intent.CATEGORY_OPENABLE);
        question.setType("*/*"); // Android has no type for scenes
        question.putExtra(Intent.EXTRA_ALLOW_MULTIPLE, true);
        try {
            startActivityForResult(question, CHOOSE);
        } catch (ActivityNotFoundException none) {
            say(getString(R.string.no_chooser));
        }
    }

    /** Opens what an intent names: one file, or a scene with its pictures. Returns false if it names no file. */
    private boolean openFrom(Intent intent) {
        List<Uri> files = new ArrayList<>();
        ClipData several = intent == null ? null : intent.getClipData();
        for (int i = 0; several != null && i < several.getItemCount(); ++i) {
            if (several.getItemAt(i).getUri() != null) {
                files.add(several.getItemAt(i).getUri());
            }
        }
        if (files.isEmpty() && intent != null && intent.getData() != null) {
            files.add(intent.getData());
        }
        if (view == null || files.isEmpty()) {
            return false;
        }
        OpenedFiles copies = new OpenedFiles(getContentResolver(), new File(getCacheDir(), "opened"));
        new Thread(() -> copyAndShow(copies, files), "copies").start(); // reading may take long
        return true;
    }

    private void copyAndShow(OpenedFiles copies, List<Uri> files) {
        try {
            File scene;
            synchronized (ViewerActivity.class) { // all copies share one folder
                scene = copies.copy(files);
            }
            runOnUiThread(() -> show(new Shown(scene.getPath(), false)));
        } catch (IOException reason) {
            runOnUiThread(() -> say(reason.getMessage()));
        }
    }

    private void show(Shown what) {
        if (view != null) {
            shown = what;
            view.show(what);
        }
    }

    private void say(String text) {
        message.setText(text);
        message.setVisibility(text.isEmpty() ? View.GONE : View.VISIBLE);
    }
}
