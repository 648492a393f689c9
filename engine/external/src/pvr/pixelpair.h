#pragma once

#include <cstdint>
#include <cstring>

namespace pvr
{

/// The channels of two pixels side by side, each red, green, blue, alpha: arithmetic works on all eight at once,
/// modulo 2^16. GCC and Clang make vector instructions of it where the processor has them, also when they
/// optimise for size.
using PixelPair [[gnu::vector_size(16)]] = uint16_t;

/// The same pixel twice.
inline PixelPair makePair(uint32_t red, uint32_t green, uint32_t blue, uint32_t alpha)
{
    const uint16_t r = uint16_t(red), g = uint16_t(green), b = uint16_t(blue), a = uint16_t(alpha);
    return PixelPair{r, g, b, a, r, g, b, a};
}

/// Writes the lower eight bits of each channel, 8 bytes altogether.
inline void putPair(uint8_t* to, const PixelPair& pair)
{
    using Bytes [[gnu::vector_size(8)]] = uint8_t;
    const Bytes bytes = __builtin_convertvector(pair, Bytes);
    std::memcpy(to, &bytes, sizeof bytes);
}

} // namespace pvr
