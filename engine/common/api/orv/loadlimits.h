#pragma once

#include "orv/export.h"

#include <cstdint>

namespace orv
{

/// How much one load may make. A load is what one call of the program starts (a cache's get(), loadAppearance(),
/// loadGloFile()) with everything that it names: pictures, shader programs, other files.
///
/// The cost of a file must follow from its size; these limits are what any file may cost on top of that. A
/// program raises them for files that it trusts, or lowers them for a device with little memory. A file that
/// goes beyond them is refused with a message, like any file that cannot be loaded. Below, N is the number of
/// bytes read in the load, each different content counted once.
struct LoadLimits
{
    /// Decoded bytes that any one picture may have, whatever it is loaded for. A larger one needs a file of 1/64 of
    /// them, and is refused above 256 MiB, or above this if this is more.
    uint64_t pictureBytes = uint64_t(64) << 20;

    /// Decoded bytes of all pictures of one load, plus 63 N. (Vertices and indices are in their files as GL
    /// gets them: at most N.)
    uint64_t textureBytes = uint64_t(256) << 20;

    /// Bytes of the shader programs that one load makes, plus N: their files, the sources with the defines, and 4096
    /// for each program.
    uint64_t programBytes = uint64_t(1) << 20;
};

/// For all loads from here on. They are the process's, since memory is, and an Image is decoded without any pool.
/// Threads: set them before other threads load.
ORV_API void setLoadLimits(const LoadLimits& limits);
ORV_API const LoadLimits& getLoadLimits();

} // namespace orv
