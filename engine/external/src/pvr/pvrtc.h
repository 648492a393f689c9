#pragma once

#include <cstddef>
#include <cstdint>

namespace pvr
{

enum class PvrtcBits : uint8_t
{
    TWO = 2, ///< blocks of 8 x 4 pixels
    FOUR = 4 ///< blocks of 4 x 4 pixels
};

/// Bytes that a PVRTC image of this size takes: 8 for each block, at least 2 x 2 blocks.
uint64_t pvrtcSize(uint32_t width, uint32_t height, PvrtcBits bits);

/// Decodes a PVRTC (first version) image.
///
/// Each block carries two colours, A and B. Both are stretched over the image, bilinearly from block centre to
/// block centre and round its edges, and each pixel has a weight that says how they are mixed. In whole numbers:
///   1. Channels are widened to 5 bits, alpha to 4, by repeating their upper bits (3 bits of alpha: a zero below).
///   2. Sums over the four nearest blocks, with weights of 1/16 (1/32 for blocks of 8 x 4), are kept exactly and
///      then brought to 8 bits: sum / 2 + sum / 64 (sum / 4 + sum / 128), for alpha sum + sum / 16
///      (sum / 2 + sum / 32), each quotient rounded down.
///   3. A pixel is (A * (8 - weight) + B * weight) / 8, rounded down.
/// So 0 and the greatest value come out as 0 and 255. Interpolated weights (2 bits) are rounded to nearest, halves
/// up. A punched-through pixel has the mix of its weight, 4, and alpha 0.
///
/// Each block says whether it is opaque. Translucent blocks keep their alpha even in a picture declared as opaque.
/// \param data at least pvrtcSize(width, height, bits) bytes
/// \param rgba receives width x height pixels of 4 bytes each
/// \return false, with nothing written, if `size` is too small or a side is not a power of two
bool decodePvrtc(const uint8_t* data, size_t size, uint32_t width, uint32_t height, PvrtcBits bits,
                 uint8_t* rgba);

} // namespace pvr
