#pragma once

#include <cstddef>

namespace orv::detail
{

/// One file compiled into the library. Text has no terminating zero byte.
struct EmbeddedAsset
{
    const char* name; ///< as assets are asked for, namespace and all
    const unsigned char* data;
    int size; ///< in bytes
};

struct EmbeddedArchive
{
    const EmbeddedAsset* assets; ///< in byte order of their names
    size_t count;
};

// Defined in sources that the build makes from the folders assets/orv and assets/luvane.
extern const EmbeddedArchive ORV_ARCHIVE;
extern const EmbeddedArchive LUVANE_ARCHIVE;

} // namespace orv::detail
