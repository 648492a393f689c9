#pragma once

/// Marks what liborv exports; everything else in the library has hidden visibility.
///
/// The library is built without run-time type information, so a program that derives from an orv class
/// (a stream source of its own, say) compiles that file with -fno-rtti as well.
#if defined(__GNUC__)
#define ORV_API __attribute__((visibility("default")))
#else
#define ORV_API
#endif
