package standin;

import java.util.concurrent.Callable;
import java.util.concurrent.ExecutionException;
import java.util.concurrent.ExecutorService;
import java.util.concurrent.Executors;
import java.util.concurrent.TimeUnit;

/** The thread of the user interface. */
public final class MainThread {
    private static ExecutorService executor = Executors.newSingleThreadExecutor();

    public static void post(Runnable what) {
        executor.execute(what);
    }

    /** Runs something there and waits for it. */
    public static <T> T call(Callable<T> what) throws Exception {
        try {
            return executor.submit(what).get(300, TimeUnit.SECONDS);
        } catch (ExecutionException thrown) {
            throw new IllegalStateException(thrown.getCause());
        }
    }

    public static void run(Runnable what) throws Exception {
        call(() -> {
            what.run();
            return null;
        });
    }

    public static boolean end() throws InterruptedException {
        executor.shutdown();
        return executor.awaitTermination(10, TimeUnit.SECONDS);
    }

    private MainThread() {}
}
