#pragma once

#include <string>

#include <jni.h>

/// Text between Java and here, as arrays of UTF-8: Java's own strings come as a modified UTF-8 that no file system knows, and
/// the virtual machine ends a program that makes one of other bytes.
namespace javatext
{

/// @param bytes  may be null.
/// @return false, with nothing in text, if there is no array or Java refuses it; no exception is left pending.
bool read(JNIEnv* env, jbyteArray bytes, std::string& text);

/// @return a new local reference; null, with an exception pending, if Java has no memory for it.
jbyteArray make(JNIEnv* env, const std::string& text);

} // namespace javatext
