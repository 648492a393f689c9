#pragma once

#include <cstddef>

namespace orv::detail
{

/// One file compiled into the library.
struct EmbeddedAsset
{
    const char* name; ///< as assets are asked for, namespace and all
    int size;         ///< in bytes, unpacked
};

/// Files that are packed as one deflate stream, one after the other in the order of their list. A few bytes follow it.
struct EmbeddedArchive
{
    const EmbeddedAsset* assets; ///< in byte order of their names
    size_t count;
    const unsigned char* packed;
    int packedSize;
    int size; ///< of all files, in bytes, unpacked
};

// Defined in sources that the build makes from the folders assets/orv and assets/luvane.
extern const EmbeddedArchive ORV_ARCHIVE;
extern const EmbeddedArchive LUVANE_ARCHIVE;

} // namespace orv::detail
