// The native functions of standin.Gl: OpenGL ES without a window, on the calling thread.

#include "headless/headless.h"

#include <androidfw/Asset.h>

#include <cstdio>
#include <memory>

#include <jni.h>

extern "C"
{

    JNIEXPORT jlong JNICALL Java_standin_Gl_make(JNIEnv*, jclass, jint width, jint height)
    {
        headless::Options options;
        options.width = width;
        options.height = height;
        options.samples = 4; // as orv-view, whose pictures are compared
        std::string error;
        std::unique_ptr<headless::Context> context = headless::Context::create(options, error);
        if (!context)
            std::fprintf(stderr, "%s\n", error.c_str());
        return reinterpret_cast<jlong>(context.release());
    }

    JNIEXPORT void JNICALL Java_standin_Gl_destroy(JNIEnv*, jclass, jlong context)
    {
        delete reinterpret_cast<headless::Context*>(context);
    }

    JNIEXPORT void JNICALL Java_standin_Gl_makeNoneCurrent(JNIEnv*, jclass)
    {
        headless::Context::makeNoneCurrent();
    }

    JNIEXPORT jboolean JNICALL Java_standin_Gl_makeCurrent(JNIEnv*, jclass, jlong context)
    {
        return reinterpret_cast<headless::Context*>(context)->makeCurrent();
    }

    /// @return RGBA, top row first.
    JNIEXPORT jbyteArray JNICALL Java_standin_Gl_read(JNIEnv* env, jclass, jlong context)
    {
        const std::vector<uint8_t> pixels = reinterpret_cast<headless::Context*>(context)->readPixels();
        jbyteArray bytes = env->NewByteArray(jsize(pixels.size()));
        if (bytes)
            env->SetByteArrayRegion(bytes, 0, jsize(pixels.size()),
                                    reinterpret_cast<const jbyte*>(pixels.data()));
        return bytes;
    }

    JNIEXPORT jint JNICALL Java_standin_Gl_countOpenAssets(JNIEnv*, jclass)
    {
        return android::Asset::getGlobalCount();
    }

} // extern "C"
