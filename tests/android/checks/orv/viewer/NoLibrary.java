package orv.viewer;

import android.content.Context;
import android.content.Intent;
import android.os.Bundle;
import android.view.View;
import android.view.ViewGroup;
import android.widget.Button;
import android.widget.TextView;
import java.io.File;
import java.nio.file.Paths;

/** The application on a device for which the package has no library: NoLibrary FOLDER STRINGS.xml, as {@link Checks}. */
public final class NoLibrary {
    public static void main(String[] arguments) throws Exception {
        Context.standInPackage = arguments[0] + "/test.apk";
        Context.standInCache = Paths.get(arguments[0], "cache").toFile();
        Context.standInStrings = Checks.readStrings(new File(arguments[1]));
        for (int i = 0; i < 2; ++i) {
            ViewerActivity activity = new ViewerActivity();
            activity.standInCreate(new Intent("android.intent.action.MAIN"), null);
            activity.standInResume();
            ViewGroup overlay = (ViewGroup) ((ViewGroup) activity.standInContent).standInChildren.get(0);
            TextView message = (TextView) overlay.standInChildren.get(0);
            Button open = (Button) ((ViewGroup) overlay.standInChildren.get(1)).standInChildren.get(0);
            open.standInClick();
            activity.standInSave(new Bundle());
            activity.standInPause();
            activity.standInDestroy();
            Checks.expect(message.standInVisibility == View.VISIBLE, "no message");
            Checks.expect(message.standInText.toString().startsWith("The package lacks"), message.standInText.toString());
        }
        System.out.println("ok      without its library it says so, each time");
    }

    private NoLibrary() {}
}
