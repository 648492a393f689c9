package orv.viewer;

import android.content.Context;
import java.io.File;
import java.io.IOException;
import java.nio.file.Files;
import java.nio.file.Path;
import java.nio.file.Paths;
import java.util.Arrays;
import java.util.HashMap;
import java.util.Map;
import javax.imageio.ImageIO;
import java.awt.image.BufferedImage;

/**
 * Runs the checks and prints a line for each: Checks FOLDER STRINGS.xml
 *
 * <p>FOLDER has app.apk (packed by aapt), test.apk (duck.glo with its picture, windmill.glo), duck.glo, windmill.glo, and
 * duck.png and windmill.png as orv-view draws them. Exit code 1 if a check fails.
 */
public final class Checks {
    interface Check {
        void run() throws Exception;
    }

    static final int WIDTH = 320;
    static final int HEIGHT = 240;
    static Path folder;
    private static int passed;
    private static int failed;

    public static void main(String[] arguments) throws Exception {
        folder = Paths.get(arguments[0]);
        Context.standInPackage = path("test.apk");
        Context.standInCache = folder.resolve("cache").toFile();
        Context.standInStrings = readStrings(new File(arguments[1]));
        NativeChecks.runAll();
        ActivityChecks.runAll();
        System.out.println(passed + " passed, " + failed + " failed");
        System.exit(failed == 0 && passed > 0 ? 0 : 1);
    }

    static void check(String name, Check check) {
        long start = System.nanoTime();
        try {
            check.run();
            ++passed;
            System.out.printf("ok      %s (%d ms)%n", name, (System.nanoTime() - start) / 1_000_000);
        } catch (Throwable reason) {
            ++failed;
            System.out.println("FAILED  " + name);
            reason.printStackTrace(System.out);
        }
    }

    static String path(String name) {
        return folder.resolve(name).toString();
    }

    static void expect(boolean holds, String what) {
        if (!holds) {
            throw new AssertionError(what);
        }
    }

    static void expectSame(byte[] one, byte[] other, String what) throws IOException {
        if (!Arrays.equals(one, other)) {
            save(one, "one.png");
            save(other, "other.png");
            throw new AssertionError(what + ": " + compare(one, other) + "; see one.png and other.png in " + folder);
        }
    }

    static void expectOther(byte[] one, byte[] other, String what) {
        expect(countUnlike(one, other, 24) > WIDTH * HEIGHT / 200, what + ": " + compare(one, other));
    }

    /** Of those pixels that differ by more than a tolerance in a channel. */
    static int countUnlike(byte[] one, byte[] other, int tolerance) {
        int count = 0;
        for (int i = 0; i + 3 < Math.min(one.length, other.length); i += 4) {
            int worst = 0;
            for (int channel = 0; channel < 3; ++channel) {
                worst = Math.max(worst, Math.abs((one[i + channel] & 255) - (other[i + channel] & 255)));
            }
            count += worst > tolerance ? 1 : 0;
        }
        return count;
    }

    static String compare(byte[] one, byte[] other) {
        return countUnlike(one, other, 0) + " pixels differ, " + countUnlike(one, other, 24) + " by more than 24 of 255";
    }

    /** RGBA, from the top. */
    static byte[] readPicture(String name) throws IOException {
        BufferedImage image = ImageIO.read(new File(path(name)));
        byte[] pixels = new byte[image.getWidth() * image.getHeight() * 4];
        for (int i = 0; i < pixels.length / 4; ++i) {
            int colour = image.getRGB(i % image.getWidth(), i / image.getWidth());
            for (int channel = 0; channel < 3; ++channel) {
                pixels[4 * i + channel] = (byte) (colour >> (16 - 8 * channel));
            }
            pixels[4 * i + 3] = (byte) 255;
        }
        return pixels;
    }

    static void save(byte[] pixels, String name) throws IOException {
        BufferedImage image = new BufferedImage(WIDTH, HEIGHT, BufferedImage.TYPE_INT_RGB);
        for (int i = 0; i < pixels.length / 4; ++i) {
            int colour = (pixels[4 * i] & 255) << 16 | (pixels[4 * i + 1] & 255) << 8 | (pixels[4 * i + 2] & 255);
            image.setRGB(i % WIDTH, i / WIDTH, colour);
        }
        ImageIO.write(image, "png", new File(path(name)));
    }

    static byte[] readFile(String name) throws IOException {
        return Files.readAllBytes(folder.resolve(name));
    }

    static Map<Integer, String> readStrings(File file) throws Exception {
        Map<Integer, String> strings = new HashMap<>();
        var list = javax.xml.parsers.DocumentBuilderFactory.newInstance()
                .newDocumentBuilder().parse(file).getElementsByTagName("string");
        for (int i = 0; i < list.getLength(); ++i) {
            var element = (org.w3c.dom.Element) list.item(i);
            int id = R.string.class.getField(element.getAttribute("name")).getInt(null);
            strings.put(id, element.getTextContent());
        }
        return strings;
    }

    private Checks() {}
}
