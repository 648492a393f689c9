package orv.viewer;

import static orv.viewer.Checks.check;
import static orv.viewer.Checks.expect;
import static orv.viewer.Checks.expectOther;
import static orv.viewer.Checks.expectSame;
import static orv.viewer.Checks.readFile;
import static orv.viewer.Checks.readPicture;

import android.app.Activity;
import android.content.ClipData;
import android.content.ContentResolver;
import android.content.Context;
import android.content.Intent;
import android.net.Uri;
import android.opengl.GLSurfaceView;
import android.os.Bundle;
import android.view.MotionEvent;
import android.view.View;
import android.view.ViewGroup;
import android.widget.Button;
import android.widget.TextView;
import java.io.File;
import java.nio.file.Files;
import java.util.concurrent.Callable;
import standin.Gl;
import standin.MainThread;

/** The application as the system runs it: its life cycle, touches, files of other applications, the GL thread. */
final class ActivityChecks {
    static void runAll() throws Exception {
        check("it starts with the package's scene, which plays, pauses and rests", ActivityChecks::start);
        check("fingers turn, move and pinch; two taps restore the picture", ActivityChecks::fingers);
        check("pausing keeps the picture, with the context or without", ActivityChecks::pauses);
        check("a file chosen while paused is shown on return, with a new context", ActivityChecks::choose);
        check("a file and its picture of another application", ActivityChecks::viewIntents);
        check("what cannot be read or shown gets a message, and the next good file is shown", ActivityChecks::badFiles);
        check("names given by other applications lead to no other folder", ActivityChecks::badNames);
        check("created again by the system, it shows the same scene", ActivityChecks::createdAgain);
        check("no thread and no asset is left", ActivityChecks::nothingLeft);
    }

    private static final class Running implements AutoCloseable {
        final ViewerActivity activity = new ViewerActivity();
        final ViewerView view;
        private final TextView message;

        Running(Intent intent, Bundle state) throws Exception {
            MainThread.run(() -> activity.standInCreate(intent, state));
            ViewGroup root = (ViewGroup) activity.standInContent;
            view = (ViewerView) root.standInChildren.get(0);
            message = (TextView) overlay().standInChildren.get(0);
            MainThread.run(activity::standInResume);
        }

        @Override
        public void close() throws Exception {
            MainThread.run(activity::standInPause);
            MainThread.run(activity::standInDestroy);
            view.queueEvent(view::togglePaused); // an event after the end does no harm
            view.standInDetach();
        }

        private ViewGroup overlay() {
            return (ViewGroup) ((ViewGroup) activity.standInContent).standInChildren.get(1);
        }

        byte[] picture() throws Exception {
            byte[] pixels = view.standInPicture(1000);
            MainThread.run(() -> {});
            return pixels;
        }

        String message() {
            return message.standInVisibility == View.VISIBLE ? message.standInText.toString() : "";
        }

        String waitForMessage() throws Exception {
            waitFor(() -> !message().isEmpty());
            return message();
        }

        void waitForScene(String name) throws Exception {
            waitFor(() -> ("Shows " + name).contentEquals(String.valueOf(view.standInDescription)));
        }

        Button button(int index) {
            ViewGroup bar = (ViewGroup) overlay().standInChildren.get(1);
            return (Button) bar.standInChildren.get(index);
        }

        void click(int index) throws Exception {
            MainThread.run(button(index)::standInClick);
        }

        void touch(int action, long time, float... places) throws Exception {
            MainThread.run(() -> view.onTouchEvent(MotionEvent.standIn(action, time, places)));
        }

        void tap(long time, float x, float y) throws Exception {
            touch(MotionEvent.ACTION_DOWN, time, x, y);
            touch(MotionEvent.ACTION_MOVE, time + 20, x + 3, y);
            touch(MotionEvent.ACTION_UP, time + 40, x + 3, y);
        }

        void pause() throws Exception {
            MainThread.run(activity::standInPause);
        }

        void resume() throws Exception {
            MainThread.run(activity::standInResume);
        }
    }

    private static void waitFor(Callable<Boolean> condition) throws Exception {
        for (int i = 0; i < 15_000; ++i) {
            if (MainThread.call(condition)) {
                return;
            }
            Thread.sleep(20);
        }
        throw new AssertionError("waited too long");
    }

    private static Uri give(String uri, String name, byte[] content) {
        ContentResolver.STAND_IN_FILES.put(uri, new ContentResolver.StandInFile(name, content));
        return Uri.parse(uri);
    }

    private static Intent view(Uri uri) {
        Intent intent = new Intent("android.intent.action.VIEW");
        intent.standInData = uri;
        return intent;
    }

    private static Intent duck() throws Exception {
        Intent intent = new Intent("android.intent.action.VIEW");
        intent.standInSeveral = new ClipData();
        intent.standInSeveral.standInItems.add(new ClipData.Item(give("content://other/1", pictureOfDuck(), readFile(pictureOfDuck()))));
        intent.standInSeveral.standInItems.add(new ClipData.Item(give("content://other/2", "duck.glo", readFile("duck.glo"))));
        return intent;
    }

    private static String pictureOfDuck() {
        for (String name : Checks.folder.toFile().list()) {
            if (name.startsWith("duck-")) {
                return name;
            }
        }
        throw new AssertionError("the duck has no picture");
    }

    private static void start() throws Exception {
        try (Running running = new Running(new Intent("android.intent.action.MAIN"), null)) {
            running.waitForScene("windmill.glo");
            byte[] one = running.view.standInPicture(2);
            byte[] other = running.view.standInPicture(20);
            expectOther(one, other, "it plays");
            expect(running.message().isEmpty(), running.message());
            expect("Pause".contentEquals(running.button(1).standInText), "the button pauses");
            running.click(1);
            byte[] still = running.picture();
            int frames = running.view.standInFrames();
            waitFor(() -> "Play".contentEquals(running.button(1).standInText));
            Thread.sleep(100);
            expect(running.view.standInFrames() == frames, "at rest nothing is drawn");
            running.click(1);
            expectOther(still, running.view.standInPicture(20), "it plays again");
        }
    }

    private static void fingers() throws Exception {
        try (Running running = new Running(duck(), null)) {
            running.waitForScene("duck.glo");
            byte[] first = running.picture();
            expectSame(readPicture("duck.png"), first, "orv-view and the application");

            running.touch(MotionEvent.ACTION_DOWN, 0, 100, 100);
            running.touch(MotionEvent.ACTION_MOVE, 10, 120, 100);
            running.touch(MotionEvent.ACTION_MOVE, 20, 220, 130);
            running.touch(MotionEvent.ACTION_UP, 30, 220, 130);
            expectOther(first, running.picture(), "one finger");
            running.tap(1000, 60, 60);
            expectOther(first, running.picture(), "one tap");
            running.tap(1150, 62, 64);
            expectSame(first, running.picture(), "two taps");

            running.touch(MotionEvent.ACTION_DOWN, 2000, 100, 100);
            running.touch(MotionEvent.ACTION_POINTER_DOWN, 2010, 100, 100, 200, 100);
            running.touch(MotionEvent.ACTION_MOVE, 2020, 100, 100, 200, 100);
            expectSame(first, running.picture(), "two fingers that rest");
            running.touch(MotionEvent.ACTION_MOVE, 2030, 50, 100, 250, 100);
            byte[] near = running.picture();
            expectOther(first, near, "pinched");
            running.touch(MotionEvent.ACTION_MOVE, 2040, 50, 130, 250, 130);
            expectOther(near, running.picture(), "moved");
            running.touch(MotionEvent.ACTION_POINTER_UP, 2050, 50, 130, 250, 130);
            byte[] left = running.picture();
            running.touch(MotionEvent.ACTION_MOVE, 2060, 250, 130);
            expectSame(left, running.picture(), "the finger that stays does not jump");
            running.touch(MotionEvent.ACTION_UP, 2070, 250, 130);
            running.tap(2100, 60, 60);
            running.tap(2200, 60, 60);
            expectSame(first, running.picture(), "two taps again");
        }
    }

    private static void pauses() throws Exception {
        for (boolean loses : new boolean[] {false, true}) {
            GLSurfaceView.standInLosesContexts = loses;
            try (Running running = new Running(duck(), null)) {
                running.waitForScene("duck.glo");
                running.touch(MotionEvent.ACTION_DOWN, 0, 100, 100);
                running.touch(MotionEvent.ACTION_MOVE, 10, 120, 100);
                running.touch(MotionEvent.ACTION_MOVE, 20, 220, 130);
                byte[] before = running.picture();
                for (int i = 0; i < 3; ++i) {
                    running.pause();
                    running.resume();
                    expectSame(before, running.picture(), "after pause " + i);
                }
                expect(running.view.standInContexts() == (loses ? 4 : 1), "contexts: " + running.view.standInContexts());
            }
        }
        GLSurfaceView.standInLosesContexts = false;
    }

    // Fault caught: a file loaded as soon as it is chosen, while no context is current.
    private static void choose() throws Exception {
        GLSurfaceView.standInLosesContexts = true;
        try (Running running = new Running(new Intent("android.intent.action.MAIN"), null)) {
            running.waitForScene("windmill.glo");
            running.click(0);
            expect(running.activity.standInQuestion != null, "no chooser of files was started");
            running.pause();
            Intent answer = duck();
            MainThread.run(() -> running.activity.standInAnswer(1, Activity.RESULT_OK, answer));
            Thread.sleep(200); // files are copied while the application is paused, too
            running.resume();
            running.waitForScene("duck.glo");
            expectSame(readPicture("duck.png"), running.picture(), "what was chosen");
            MainThread.run(() -> running.activity.standInAnswer(1, 0, null));
            expectSame(readPicture("duck.png"), running.picture(), "after no choice");
        }
        GLSurfaceView.standInLosesContexts = false;
    }

    private static void viewIntents() throws Exception {
        try (Running running = new Running(duck(), null)) {
            running.waitForScene("duck.glo");
            expect(running.message().isEmpty(), running.message());
            Uri unnamed = give("content://other/document%3A12", null, readFile("windmill.glo"));
            MainThread.run(() -> running.activity.standInNewIntent(view(unnamed)));
            running.waitForScene("document:12.glo");
            Uri alone = give("content://other/2", "duck.glo", readFile("duck.glo"));
            MainThread.run(() -> running.activity.standInNewIntent(view(alone)));
            expect(running.waitForMessage().contains("missing"), running.message());
        }
    }

    private static void badFiles() throws Exception {
        try (Running running = new Running(view(Uri.parse("content://other/refused")), null)) {
            expect(running.waitForMessage().contains("cannot be read: gone"), running.message());
            Uri throwing = give("content://other/5", "throwing.glo", null);
            MainThread.run(() -> running.activity.standInNewIntent(view(throwing)));
            waitFor(() -> running.message().contains("throwing.glo: cannot be read: not now"));
            byte[] half = java.util.Arrays.copyOf(readFile("windmill.glo"), 3000);
            Uri damaged = give("content://other/3", "half.glo", half);
            MainThread.run(() -> running.activity.standInNewIntent(view(damaged)));
            waitFor(() -> running.message().contains("half.glo"));
            expect(running.button(1).standInVisibility == View.GONE, "there is nothing to play");
            Intent good = duck();
            MainThread.run(() -> running.activity.standInNewIntent(good));
            running.waitForScene("duck.glo");
            expect(running.message().isEmpty(), running.message());
        }
    }

    private static void badNames() throws Exception {
        File opened = new File(Context.standInCache, "opened");
        String[] names = {"../../evil.glo", "/tmp/evil.glo", "..", ".", "", "a\u0000b"};
        try (Running running = new Running(new Intent("android.intent.action.MAIN"), null)) {
            for (String name : names) {
                Uri uri = give("content://other/4", name, readFile("windmill.glo"));
                MainThread.run(() -> running.activity.standInNewIntent(view(uri)));
                running.waitForScene(name.endsWith("evil.glo") ? "evil.glo" : "scene.glo");
                expect(opened.list().length == 1, name + ": " + String.join(", ", opened.list()));
            }
        }
        expect(!Files.exists(opened.toPath().resolve("../../evil.glo")), "a file outside of the folder");
    }

    private static void createdAgain() throws Exception {
        Bundle state = new Bundle();
        byte[] before;
        try (Running running = new Running(duck(), null)) {
            running.waitForScene("duck.glo");
            before = running.picture();
            MainThread.run(() -> running.activity.standInSave(state));
        }
        try (Running running = new Running(new Intent("android.intent.action.MAIN"), state)) {
            running.waitForScene("duck.glo");
            expectSame(before, running.picture(), "created again");
        }
    }

    private static void nothingLeft() throws Exception {
        expect(Gl.countOpenAssets() == 0, "open assets: " + Gl.countOpenAssets());
        expect(MainThread.end(), "the main thread goes on");
        for (Thread thread : Thread.getAllStackTraces().keySet()) {
            expect(!thread.getName().equals("GL") && !thread.getName().equals("copies"), thread + " is alive");
        }
    }

    private ActivityChecks() {}
}
