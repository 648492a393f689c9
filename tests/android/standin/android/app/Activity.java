package android.app;

import android.content.Context;
import android.content.Intent;
import android.os.Bundle;
import android.view.View;
import standin.MainThread;

public class Activity extends Context {
    public static final int RESULT_OK = -1;

    public View standInContent;
    public Intent standInIntent;
    public Intent standInQuestion;

    protected void onCreate(Bundle state) {}

    protected void onNewIntent(Intent intent) {}

    protected void onPause() {}

    protected void onResume() {}

    protected void onSaveInstanceState(Bundle state) {}

    protected void onDestroy() {}

    protected void onActivityResult(int request, int result, Intent answer) {}

    public void setContentView(View view) {
        standInContent = view;
    }

    public Intent getIntent() {
        return standInIntent;
    }

    public void startActivityForResult(Intent question, int request) {
        standInQuestion = question;
    }

    public final void runOnUiThread(Runnable what) {
        MainThread.post(what);
    }

    public void standInCreate(Intent intent, Bundle state) {
        standInIntent = intent;
        onCreate(state);
    }

    public void standInPause() {
        onPause();
    }

    public void standInResume() {
        onResume();
    }

    public void standInSave(Bundle state) {
        onSaveInstanceState(state);
    }

    public void standInDestroy() {
        onDestroy();
    }

    public void standInNewIntent(Intent intent) {
        onNewIntent(intent);
    }

    public void standInAnswer(int request, int result, Intent answer) {
        onActivityResult(request, result, answer);
    }
}
