#pragma once

#include <cstdint>
#include <string>
#include <vector>

namespace imagefiles
{

using Bytes = std::vector<uint8_t>;

/// An image file in memory.
/// @param suffix  "png", "jpg", "bmp" or "tga".
/// @param pixels  width x height x channels bytes, top row first.
Bytes encode(const std::string& suffix, int width, int height, int channels, const Bytes& pixels);

/// The same with every channel of every pixel equal to value.
Bytes encodeFlat(const std::string& suffix, int width, int height, int channels, uint8_t value = 128);

} // namespace imagefiles
