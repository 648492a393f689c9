package orv.viewer;

import android.content.ContentResolver;
import android.database.Cursor;
import android.net.Uri;
import android.provider.OpenableColumns;
import java.io.File;
import java.io.FileOutputStream;
import java.io.IOException;
import java.io.InputStream;
import java.io.OutputStream;
import java.util.List;
import java.util.Locale;

/** Copies files of other applications into one folder, since the engine can only read files. */
final class OpenedFiles {
    private static final String[] SCENES = {".glo", ".ap", ".sp"};

    private final ContentResolver resolver;
    private final File folder;

    /** @param folder for the copies; all other files in it are deleted. */
    OpenedFiles(ContentResolver resolver, File folder) {
        this.resolver = resolver;
        this.folder = folder;
    }

    /**
     * Copies a scene and the files that it names. Earlier copies are deleted.
     *
     * @return the scene: the first file with the suffix of a scene, or else the first file.
     * @throws IOException with a message for the user.
     */
    File copy(List<Uri> files) throws IOException {
        clear();
        if (!folder.isDirectory() && !folder.mkdirs()) {
            throw new IOException(folder.getPath() + ": the folder cannot be made");
        }
        File scene = null;
        boolean isNamed = false;
        for (Uri file : files) {
            File target = new File(folder, getName(file));
            copy(file, target);
            if (scene == null || (!isNamed && isScene(target.getName()))) {
                scene = target;
                isNamed = isScene(target.getName());
            }
        }
        if (scene == null) {
            throw new IOException("no file was chosen");
        }
        return isNamed ? scene : asScene(scene);
    }

    /** Adds the suffix of a scene: other applications may pass a scene under a name without one. */
    private static File asScene(File file) throws IOException {
        File named = new File(file.getPath() + SCENES[0]);
        if (!file.renameTo(named)) {
            throw new IOException(file.getName() + ": cannot be renamed");
        }
        return named;
    }

    private static boolean isScene(String name) {
        for (String suffix : SCENES) {
            if (name.toLowerCase(Locale.ROOT).endsWith(suffix)) {
                return true;
            }
        }
        return false;
    }

    private void clear() {
        File[] old = folder.listFiles();
        for (File file : old == null ? new File[0] : old) {
            file.delete();
        }
    }

    private void copy(Uri from, File to) throws IOException {
        try (InputStream in = resolver.openInputStream(from);
                OutputStream out = new FileOutputStream(to)) {
            if (in == null) {
                throw new IOException("there is no such file");
            }
            byte[] buffer = new byte[1 << 16];
            for (int count = in.read(buffer); count >= 0; count = in.read(buffer)) {
                out.write(buffer, 0, count);
            }
        } catch (IOException | RuntimeException reason) { // another application may throw anything
            throw new IOException(to.getName() + ": cannot be read: " + reason.getMessage(), reason);
        }
    }

    /** Returns a name without folders, so that nothing is written outside of the folder. */
    private String getName(Uri file) {
        String name = "file".equals(file.getScheme()) ? null : askName(file);
        if (name == null) {
            name = file.getLastPathSegment();
        }
        name = name == null ? "" : name.substring(name.lastIndexOf('/') + 1);
        return name.isEmpty() || name.equals(".") || name.equals("..") || name.indexOf('\0') >= 0 ? "scene" : name;
    }

    private String askName(Uri file) {
        String[] columns = {OpenableColumns.DISPLAY_NAME};
        try (Cursor cursor = resolver.query(file, columns, null, null, null)) {
            return cursor != null && cursor.moveToFirst() ? cursor.getString(0) : null;
        } catch (RuntimeException refused) { // by the other application; its file may be readable nevertheless
            return null;
        }
    }
}
