package android.database;

public interface Cursor extends java.io.Closeable {
    boolean moveToFirst();

    String getString(int column);

    @Override
    void close();
}
