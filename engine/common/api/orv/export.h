#pragma once

/// Marks what liborv exports; everything else in the library has hidden visibility.
///
/// The library is built without run-time type information; programs need not be. They may derive from its
/// interfaces (Shared, Stream, StreamSource, AssetLoader, Renderer, SceneNodeVisitor, Animation and its kin) as they
/// please; a source that derives from any other class is compiled with -fno-rtti. dynamic_cast and typeid do not
/// work on the library's objects.
///
/// ORV_LOCAL hides a private member of an exported class again, where no inline function calls it.
#if defined(__GNUC__)
#define ORV_API __attribute__((visibility("default")))
#define ORV_LOCAL __attribute__((visibility("hidden")))
#else
#define ORV_API
#define ORV_LOCAL
#endif
