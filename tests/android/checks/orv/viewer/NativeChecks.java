package orv.viewer;

import static orv.viewer.Checks.HEIGHT;
import static orv.viewer.Checks.WIDTH;
import static orv.viewer.Checks.check;
import static orv.viewer.Checks.expect;
import static orv.viewer.Checks.expectOther;
import static orv.viewer.Checks.expectSame;
import static orv.viewer.Checks.path;
import static orv.viewer.Checks.readFile;
import static orv.viewer.Checks.readPicture;

import android.content.res.AssetManager;
import java.lang.reflect.InvocationTargetException;
import java.lang.reflect.Method;
import java.lang.reflect.Modifier;
import java.nio.charset.StandardCharsets;
import java.nio.file.Files;
import java.util.Arrays;
import standin.Gl;

/** The functions that Java calls, on one thread with contexts of its own. */
final class NativeChecks {
    private static long context;

    static void runAll() {
        check("an asset of what aapt packed looks as orv-view draws it", NativeChecks::packedAsset);
        check("a scene with a picture: asset, file and orv-view draw the same", NativeChecks::texturedAsset);
        check("an opened file takes no pictures from the package", NativeChecks::fileAlone);
        check("turn, pan and zoom change the picture, frameAll restores it", NativeChecks::hands);
        check("after lost contexts the same picture bit for bit", NativeChecks::lostContexts);
        check("clips play, pause and go on after a lost context", NativeChecks::clips);
        check("a missing file gets a message, the next good one is shown", NativeChecks::missing);
        check("a damaged file gets a message at every length", NativeChecks::damaged);
        check("names and messages may hold any bytes", NativeChecks::oddNames);
        check("without a context, and with values that are no numbers, nothing happens", NativeChecks::misuse);
        check("without a viewer no function does anything", NativeChecks::noHandle);
        check("no asset stays open", () -> expect(Gl.countOpenAssets() == 0, "open: " + Gl.countOpenAssets()));
    }

    private static Shown asset(String name) {
        return new Shown(name, true);
    }

    private static Shown file(String name) {
        return new Shown(path(name), false);
    }

    /** A check with a viewer and a context of its own. */
    private interface Use {
        void of(NativeViewer viewer) throws Exception;
    }

    private static void with(String apk, Use use) throws Exception {
        context = Gl.make(WIDTH, HEIGHT);
        NativeViewer viewer = new NativeViewer(new AssetManager(path(apk)));
        viewer.setSize(WIDTH, HEIGHT);
        try {
            expect(viewer.replaceContext(), "the first context");
            use.of(viewer);
        } finally {
            viewer.release();
            Gl.destroy(context);
        }
    }

    private static byte[] open(NativeViewer viewer, Shown shown) {
        expect(viewer.open(shown), shown.path + ": " + viewer.getMessage());
        return picture(viewer);
    }

    private static byte[] picture(NativeViewer viewer) {
        viewer.draw(0);
        return Gl.read(context);
    }

    private static void loseContext(NativeViewer viewer) {
        Gl.destroy(context);
        context = Gl.make(WIDTH, HEIGHT);
        expect(viewer.replaceContext(), viewer.getMessage());
    }

    private static void packedAsset() throws Exception {
        with("app.apk", viewer -> {
            byte[] shown = open(viewer, asset("windmill.glo"));
            expectSame(readPicture("windmill.png"), shown, "orv-view and the application");
            expect(viewer.getMessage().isEmpty(), viewer.getMessage());
        });
    }

    private static void texturedAsset() throws Exception {
        with("test.apk", viewer -> {
            byte[] shown = open(viewer, asset("duck.glo"));
            expectSame(readPicture("duck.png"), shown, "orv-view and the asset");
            expectSame(shown, open(viewer, file("duck.glo")), "the asset and the file");
            expect(viewer.getMessage().isEmpty(), viewer.getMessage());
        });
    }

    // Fault caught: a file whose picture is missing shows a picture of the package with the same name.
    private static void fileAlone() throws Exception {
        Files.createDirectories(Checks.folder.resolve("alone"));
        Files.write(Checks.folder.resolve("alone/duck.glo"), readFile("duck.glo"));
        with("test.apk", viewer -> {
            byte[] whole = open(viewer, asset("duck.glo"));
            byte[] alone = open(viewer, file("alone/duck.glo"));
            expectOther(whole, alone, "without its picture");
            expect(viewer.getMessage().contains("missing"), viewer.getMessage());
        });
    }

    private static void hands() throws Exception {
        with("test.apk", viewer -> {
            byte[] first = open(viewer, asset("duck.glo"));
            Runnable[] hands = {() -> viewer.turn(60, 0), () -> viewer.turn(0, -40), () -> viewer.pan(50, 20),
                    () -> viewer.zoom(1.5f), () -> viewer.zoom(0.5f)};
            for (int i = 0; i < hands.length; ++i) {
                hands[i].run();
                expectOther(first, picture(viewer), "hand " + i);
                viewer.frameAll();
                expectSame(first, picture(viewer), "after hand " + i);
            }
        });
    }

    private static void lostContexts() throws Exception {
        with("test.apk", viewer -> {
            open(viewer, asset("duck.glo"));
            viewer.turn(90, 20);
            viewer.zoom(1.3f);
            byte[] before = picture(viewer);
            for (int i = 0; i < 5; ++i) {
                loseContext(viewer);
                expectSame(before, picture(viewer), "after loss " + i);
            }
            viewer.stepCamera();
            before = picture(viewer);
            loseContext(viewer);
            expectSame(before, picture(viewer), "through the file's camera");
        });
    }

    private static void clips() throws Exception {
        with("test.apk", viewer -> {
            byte[] start = open(viewer, asset("windmill.glo"));
            expect(viewer.getClipCount() > 0 && !viewer.isPaused(), "it plays");
            expect(viewer.draw(0.2f), "it moves");
            byte[] later = Gl.read(context);
            expectOther(start, later, "after 0.2 s");
            loseContext(viewer);
            expectSame(later, picture(viewer), "at the same moment");
            viewer.togglePaused();
            expect(viewer.isPaused() && !viewer.draw(0.2f), "it rests");
            expectSame(later, Gl.read(context), "while it rests");
            loseContext(viewer);
            expect(viewer.isPaused(), "it still rests");
            viewer.togglePaused();
            viewer.stepClip();
            expectSame(start, picture(viewer), "from the start of the clip");
        });
    }

    private static void missing() throws Exception {
        with("test.apk", viewer -> {
            for (Shown none : new Shown[] {asset("none.glo"), file("none.glo"), asset(""), file("")}) {
                expect(!viewer.open(none) && !viewer.isOpen(), none.path + " is shown");
                expect(viewer.getMessage().contains(none.path) && !viewer.getMessage().isEmpty(), viewer.getMessage());
                expect(!viewer.draw(1), "nothing moves");
                expect(viewer.replaceContext(), "nothing is to be loaded again");
            }
            expectSame(readPicture("duck.png"), open(viewer, asset("duck.glo")), "the next one");
        });
    }

    private static void damaged() throws Exception {
        byte[] whole = readFile("windmill.glo");
        with("test.apk", viewer -> {
            int refused = 0;
            for (int length = 0; length < whole.length; length += 97) {
                Files.write(Checks.folder.resolve("damaged.glo"), Arrays.copyOf(whole, length));
                boolean isShown = viewer.open(file("damaged.glo"));
                expect(isShown || viewer.getMessage().contains("damaged.glo"), length + ": " + viewer.getMessage());
                picture(viewer);
                refused += isShown ? 0 : 1;
            }
            expect(refused > 50, "refused: " + refused);
            open(viewer, asset("windmill.glo"));
        });
    }

    private static void oddNames() throws Exception {
        String name = "M\u00fchle \ud83d\ude00 \u0416.glo";
        byte[] material = "1.0\nno word\u0000\n".getBytes(StandardCharsets.UTF_8);
        material[6] = (byte) 0xff;
        Files.write(Checks.folder.resolve(name), readFile("windmill.glo"));
        Files.write(Checks.folder.resolve("odd.ap"), material);
        with("test.apk", viewer -> {
            expectSame(readPicture("windmill.png"), open(viewer, file(name)), "by another name");
            expect(!viewer.open(file("no " + name)), "there is none");
            expect(viewer.getMessage().contains("no " + name), viewer.getMessage());
            expect(!viewer.open(file("odd.ap")), "no material");
            expect(viewer.getMessage().contains("odd.ap"), viewer.getMessage());
        });
    }

    private static void misuse() throws Exception {
        NativeViewer bare = new NativeViewer(new AssetManager(path("test.apk")));
        expect(!bare.open(asset("duck.glo")) && !bare.draw(1), "without a context");
        expect(bare.getMessage().equals("the GL context is lost"), bare.getMessage());
        bare.release();
        with("test.apk", viewer -> {
            byte[] first = open(viewer, asset("duck.glo"));
            viewer.turn(Float.NaN, 0);
            viewer.pan(0, Float.POSITIVE_INFINITY);
            viewer.zoom(Float.NaN);
            viewer.zoom(0);
            viewer.zoom(-1);
            viewer.draw(Float.NaN);
            expectSame(first, picture(viewer), "after no numbers");
            viewer.setSize(-1, 0);
            viewer.draw(0);
        });
        expect((long) call("create", (Object) null) == 0, "of no assets");
        expect((long) call("create", new AssetManager(path("no such package"))) == 0, "of no package");
    }

    private static void noHandle() throws Exception {
        NativeViewer gone = new NativeViewer(new AssetManager(path("test.apk")));
        gone.release();
        gone.release();
        expect(!gone.replaceContext() && !gone.open(asset("duck.glo")) && gone.getMessage().isEmpty(), "after its end");
        int count = 0;
        for (Method method : NativeViewer.class.getDeclaredMethods()) {
            if (Modifier.isNative(method.getModifiers()) && !method.getName().equals("create")) {
                Object[] arguments = Arrays.stream(method.getParameterTypes()).map(NativeChecks::nothing).toArray();
                method.setAccessible(true);
                method.invoke(null, arguments);
                ++count;
            }
        }
        expect(count >= 15, "functions: " + count);
    }

    private static Object nothing(Class<?> type) {
        return type == long.class ? (Object) 0L
                : type == int.class ? (Object) 0
                : type == float.class ? (Object) 0f
                : type == boolean.class ? (Object) false
                : null;
    }

    private static Object call(String name, Object argument) throws Exception {
        Method method = NativeViewer.class.getDeclaredMethod(name, AssetManager.class);
        method.setAccessible(true);
        try {
            return method.invoke(null, argument);
        } catch (InvocationTargetException thrown) {
            throw new IllegalStateException(thrown.getCause());
        }
    }

    private NativeChecks() {}
}
