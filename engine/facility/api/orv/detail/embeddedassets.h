#pragma once

#include <cstddef>

namespace orv::detail
{

/// One file compiled into the library.
struct EmbeddedAsset
{
    const char* name;           ///< as assets are asked for, namespace and all
    const unsigned char* bytes; ///< read-only, for the life of the process
    int size;                   ///< in bytes
};

/// The files of one folder, in byte order of their names.
struct EmbeddedArchive
{
    const EmbeddedAsset* assets;
    size_t count;
};

// Defined in sources that the build makes from folders of assets; the last one beside the library, not in it.
extern const EmbeddedArchive ORV_ARCHIVE;
extern const EmbeddedArchive LUVANE_ARCHIVE;
extern const EmbeddedArchive SHADOW_ARCHIVE;

} // namespace orv::detail
