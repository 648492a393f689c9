#pragma once

#include "pvr/pvrcodes.h"
#include "pvr/pvrencoder.h"

#include <vector>

/// The writing side of PVR files, for samples and tests.
namespace pvr
{

struct WriteOptions
{
    Header header = Header::VERSION_3;
    bool bigEndian = false;
    bool hasMipmaps = true;             ///< all levels down to one pixel, each the mean of the one before
    bool bottomRowFirst = false;        ///< legacy headers only
    std::vector<uint8_t> metadata = {}; ///< version 3 only
};

/// A whole PVR file.
std::vector<uint8_t> write(const SourcePicture& picture, Format format, const WriteOptions& options = {});

/// Half the picture in both directions, as mipmaps are: sides rounded down, at least 1.
SourcePicture halve(const SourcePicture& picture);

} // namespace pvr
