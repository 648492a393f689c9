#pragma once

#include <string>

#include <jni.h>

/// Passes text between Java and C++ as arrays of UTF-8 bytes. JNI's own functions for strings use a modified UTF-8, which
/// differs from that of file names, and may abort the program if they get other bytes.
namespace javatext
{

/// @param bytes  may be null.
/// @return false, with nothing in text, if there is no array or Java refuses it; no exception is left pending.
bool read(JNIEnv* env, jbyteArray bytes, std::string& text);

/// @return a new local reference; null, with an exception pending, if Java has no memory for it.
jbyteArray make(JNIEnv* env, const std::string& text);

} // namespace javatext
