#pragma once

#include <cstddef>
#include <cstdint>

namespace pvr
{

/// Bytes that an ETC1 image of this size takes: 8 for each 4 x 4 block, partly filled blocks included.
uint64_t etc1Size(uint32_t width, uint32_t height);

/// Decodes an ETC1 image.
///
/// A block whose second base colour leaves 0..31 is undefined, and encoders write none. Here the sum keeps its
/// lower five bits, as in Android's libETC1; drivers differ (Mesa lets it overflow eight bits).
/// \param data at least etc1Size(width, height) bytes, blocks row by row from the first row of pixels
/// \param rgba receives width x height pixels of 4 bytes each, rows in the order of the blocks, alpha 255
/// \return false, with nothing written, if `size` is too small or a side is 0
bool decodeEtc1(const uint8_t* data, size_t size, uint32_t width, uint32_t height, uint8_t* rgba);

} // namespace pvr
