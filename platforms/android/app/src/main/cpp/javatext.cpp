#include "javatext.h"

namespace javatext
{

bool read(JNIEnv* env, jbyteArray bytes, std::string& text)
{
    text.clear();
    if (!bytes)
        return false;
    const jsize length = env->GetArrayLength(bytes);
    std::string content(size_t(length), '\0');
    env->GetByteArrayRegion(bytes, 0, length, reinterpret_cast<jbyte*>(content.data()));
    if (env->ExceptionCheck())
    {
        env->ExceptionClear();
        return false;
    }
    text = std::move(content);
    return true;
}

jbyteArray make(JNIEnv* env, const std::string& text)
{
    const auto length = jsize(text.size());
    jbyteArray bytes = env->NewByteArray(length);
    if (bytes)
        env->SetByteArrayRegion(bytes, 0, length, reinterpret_cast<const jbyte*>(text.data()));
    return bytes;
}

} // namespace javatext
