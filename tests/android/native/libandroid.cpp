// On a device, Java's asset manager wraps one of libandroidfw. The stand-in for Java's has the path of a package.

#include <android/asset_manager_jni.h>
#include <androidfw/AssetManager.h>

#include <map>
#include <memory>
#include <mutex>
#include <string>

namespace
{

std::mutex g_lock;
std::map<std::string, std::unique_ptr<android::AssetManager>>
    g_packages; ///< by path; they stay until the end

std::string getPath(JNIEnv* env, jobject assets)
{
    jclass type = env->GetObjectClass(assets);
    jfieldID field = env->GetFieldID(type, "standInPackage", "Ljava/lang/String;");
    if (!field)
        return {};
    auto path = static_cast<jstring>(env->GetObjectField(assets, field));
    const char* chars = path ? env->GetStringUTFChars(path, nullptr) : nullptr;
    std::string result = chars ? chars : "";
    if (chars)
        env->ReleaseStringUTFChars(path, chars);
    return result;
}

} // namespace

AAssetManager* AAssetManager_fromJava(JNIEnv* env, jobject assets)
{
    const std::string path = getPath(env, assets);
    const std::lock_guard<std::mutex> guard(g_lock);
    std::unique_ptr<android::AssetManager>& package = g_packages[path];
    if (!package)
    {
        package = std::make_unique<android::AssetManager>();
        if (!package->addAssetPath(android::String8(path.c_str()), nullptr))
            package.reset();
    }
    return package.get();
}
