#pragma once

#include <cstddef>
#include <cstdint>
#include <string>

namespace orv::detail
{

/// A GL texture made from a PVR file. The holder of the record owns the texture.
struct PvrTexture
{
    unsigned glName = 0;
    unsigned width = 0;        ///< pixels
    unsigned height = 0;       ///< pixels
    unsigned bitsPerPixel = 0; ///< of what GL holds: that of the file unless it had to be decoded
    unsigned mipmapCount = 0;  ///< beyond the largest level, as GL holds them

    bool hasUnusedMipmaps = false; ///< the file has mipmaps that GL could not use
};

/// Makes a GL texture from the bytes of a PVR file and sets its filters and wraps; see PvrTextureLoader.
/// GL thread only. The texture stays bound on the active unit.
/// @param error  receives what is wrong.
/// @return false, with no texture left behind, if the file cannot be used or GL refuses it.
bool uploadPvr(const uint8_t* data, size_t size, PvrTexture& texture, std::string& error);

} // namespace orv::detail
