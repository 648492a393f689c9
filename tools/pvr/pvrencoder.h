#pragma once

#include "pvr/pvrformat.h"

#include <cstddef>
#include <vector>

namespace pvr
{

/// RGBA pixels, 4 bytes each, top row first.
struct SourcePicture
{
    uint32_t width = 0;
    uint32_t height = 0;
    std::vector<uint8_t> rgba;

    const uint8_t* pixel(uint32_t x, uint32_t y) const { return &rgba[4 * (size_t(y) * width + x)]; }
};

/// The picture's pixels in a format: what a level of a PVR file holds.
///
/// Luminance is perceptual. ETC1 is encoded by libetc1. PVRTC is encoded simply: the darkest and the brightest colour
/// of each block, and for each pixel the nearest mix of the decoded colours.
/// @param picture  for PVRTC, of power-of-two sides.
std::vector<uint8_t> encode(const SourcePicture& picture, Format format, bool bigEndian);

} // namespace pvr
