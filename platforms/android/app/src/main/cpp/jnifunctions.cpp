// The native functions of orv.viewer.NativeViewer. A handle is a pointer to a Holder; with handle 0, they do nothing. Java
// makes one call at a time for each handle, and draws and loads on the thread whose GL context is current.

#include "javatext.h"
#include "nativeviewer.h"

#include <android/asset_manager_jni.h>

#include <cmath>
#include <memory>
#include <new>

namespace
{

/// A viewer, and a reference that keeps its assets alive.
struct Holder
{
    Holder(AAssetManager* manager, jobject reference) : viewer(manager), assets(reference) {}

    android::NativeViewer viewer;
    jobject assets; ///< a global reference
};

Holder* getHolder(jlong handle)
{
    return reinterpret_cast<Holder*>(handle);
}

/// @return null where no scene is open.
android::NativeViewer* getOpenViewer(jlong handle)
{
    Holder* holder = getHolder(handle);
    return holder && holder->viewer.isOpen() ? &holder->viewer : nullptr;
}

bool areNumbers(float one, float other)
{
    return std::isfinite(one) && std::isfinite(other);
}

} // namespace

extern "C"
{

    JNIEXPORT jlong JNICALL Java_orv_viewer_NativeViewer_create(JNIEnv* env, jclass, jobject assets)
    {
        AAssetManager* manager = assets ? AAssetManager_fromJava(env, assets) : nullptr;
        if (!manager)
            return 0;
        jobject reference = env->NewGlobalRef(assets);
        if (!reference)
            return 0;
        auto* holder = new (std::nothrow) Holder(manager, reference);
        if (!holder)
            env->DeleteGlobalRef(reference);
        return reinterpret_cast<jlong>(holder);
    }

    /// Makes no GL call: GL objects are deleted together with their context.
    JNIEXPORT void JNICALL Java_orv_viewer_NativeViewer_destroy(JNIEnv* env, jclass, jlong handle)
    {
        Holder* holder = getHolder(handle);
        if (!holder)
            return;
        jobject assets = holder->assets;
        holder->viewer.loseContext();
        delete holder;
        env->DeleteGlobalRef(assets);
    }

    JNIEXPORT jboolean JNICALL Java_orv_viewer_NativeViewer_replaceContext(JNIEnv*, jclass, jlong handle)
    {
        Holder* holder = getHolder(handle);
        return holder && holder->viewer.replaceContext();
    }

    JNIEXPORT void JNICALL Java_orv_viewer_NativeViewer_setSize(JNIEnv*, jclass, jlong handle, jint width,
                                                                jint height)
    {
        if (Holder* holder = getHolder(handle))
            holder->viewer.setSize(width, height);
    }

    /// @return whether the next frame would show something else.
    JNIEXPORT jboolean JNICALL Java_orv_viewer_NativeViewer_draw(JNIEnv*, jclass, jlong handle,
                                                                 jfloat seconds)
    {
        Holder* holder = getHolder(handle);
        return holder && holder->viewer.draw(std::isfinite(seconds) ? seconds : 0.0f);
    }

    /// @param isAsset  whether the path is a name in the package's assets folder.
    JNIEXPORT jboolean JNICALL Java_orv_viewer_NativeViewer_open(JNIEnv* env, jclass, jlong handle,
                                                                 jbyteArray path, jboolean isAsset)
    {
        Holder* holder = getHolder(handle);
        view::SceneFile file;
        if (!holder || !javatext::read(env, path, file.path))
            return JNI_FALSE;
        file.isAsset = isAsset;
        return holder->viewer.open(file);
    }

    JNIEXPORT jboolean JNICALL Java_orv_viewer_NativeViewer_isOpen(JNIEnv*, jclass, jlong handle)
    {
        return getOpenViewer(handle) != nullptr;
    }

    JNIEXPORT jbyteArray JNICALL Java_orv_viewer_NativeViewer_getMessage(JNIEnv* env, jclass, jlong handle)
    {
        const Holder* holder = getHolder(handle);
        return javatext::make(env, holder ? holder->viewer.getMessage() : std::string());
    }

    JNIEXPORT void JNICALL Java_orv_viewer_NativeViewer_turn(JNIEnv*, jclass, jlong handle, jfloat right,
                                                             jfloat down)
    {
        android::NativeViewer* viewer = getOpenViewer(handle);
        if (viewer && areNumbers(right, down))
            viewer->turn(right, down);
    }

    JNIEXPORT void JNICALL Java_orv_viewer_NativeViewer_pan(JNIEnv*, jclass, jlong handle, jfloat right,
                                                            jfloat down)
    {
        android::NativeViewer* viewer = getOpenViewer(handle);
        if (viewer && areNumbers(right, down))
            viewer->pan(right, down);
    }

    /// @param factor  of the size of things on the screen, above 0.
    JNIEXPORT void JNICALL Java_orv_viewer_NativeViewer_zoom(JNIEnv*, jclass, jlong handle, jfloat factor)
    {
        android::NativeViewer* viewer = getOpenViewer(handle);
        if (viewer && std::isfinite(factor) && factor > 0.0f)
            viewer->zoom(std::log(factor) / -std::log(view::Orbit::ZOOM_STEP));
    }

    JNIEXPORT void JNICALL Java_orv_viewer_NativeViewer_frameAll(JNIEnv*, jclass, jlong handle)
    {
        if (android::NativeViewer* viewer = getOpenViewer(handle))
            viewer->frameAll();
    }

    JNIEXPORT jint JNICALL Java_orv_viewer_NativeViewer_getCameraCount(JNIEnv*, jclass, jlong handle)
    {
        android::NativeViewer* viewer = getOpenViewer(handle);
        return viewer ? viewer->getStage().getCameraCount() : 0;
    }

    JNIEXPORT void JNICALL Java_orv_viewer_NativeViewer_stepCamera(JNIEnv*, jclass, jlong handle)
    {
        if (android::NativeViewer* viewer = getOpenViewer(handle))
            viewer->stepCamera(1);
    }

    JNIEXPORT jint JNICALL Java_orv_viewer_NativeViewer_getClipCount(JNIEnv*, jclass, jlong handle)
    {
        android::NativeViewer* viewer = getOpenViewer(handle);
        return viewer ? jint(viewer->getPlayer().getClips().size()) : 0;
    }

    JNIEXPORT void JNICALL Java_orv_viewer_NativeViewer_stepClip(JNIEnv*, jclass, jlong handle)
    {
        if (android::NativeViewer* viewer = getOpenViewer(handle))
            viewer->getPlayer().stepClip(1);
    }

    JNIEXPORT void JNICALL Java_orv_viewer_NativeViewer_togglePaused(JNIEnv*, jclass, jlong handle)
    {
        if (android::NativeViewer* viewer = getOpenViewer(handle))
            viewer->getPlayer().togglePaused();
    }

    JNIEXPORT jboolean JNICALL Java_orv_viewer_NativeViewer_isPaused(JNIEnv*, jclass, jlong handle)
    {
        android::NativeViewer* viewer = getOpenViewer(handle);
        return !viewer || viewer->getPlayer().isPaused() || !viewer->getPlayer().isMoving();
    }

} // extern "C"
