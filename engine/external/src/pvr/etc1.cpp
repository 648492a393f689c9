#include "pvr/etc1.h"

#include "pvr/pixelpair.h"

#include <algorithm>
#include <cstring>

namespace pvr
{
namespace
{

constexpr unsigned SIDE = 4; // pixels of a block
constexpr unsigned BLOCK_BYTES = 8;
constexpr unsigned SHADES = 4;
constexpr unsigned PIXEL_BYTES = 4;

/// Offsets from a base colour: the smaller and the larger step of each table.
constexpr uint16_t STEPS[8][2] = {{2, 8},   {5, 17},  {9, 29},   {13, 42},
                                  {18, 60}, {24, 80}, {33, 106}, {47, 183}};

uint32_t readBigEndian(const uint8_t* bytes)
{
    return uint32_t(bytes[0]) << 24 | uint32_t(bytes[1]) << 16 | uint32_t(bytes[2]) << 8 | bytes[3];
}

uint32_t expand4(uint32_t value)
{
    return (value & 15) * 17;
}

uint32_t expand5(uint32_t value)
{
    value &= 31;
    return value << 3 | value >> 2;
}

/// The sum of a channel's five bits and the signed three bits below them.
uint32_t expandSum(uint32_t value)
{
    const uint32_t difference = ((value & 7) ^ 4) - 4;
    return expand5((value >> 3) + difference);
}

/// Writes two shades, clamped to 0..255.
void putShades(uint8_t* to, const PixelPair& sums)
{
    using Signed [[gnu::vector_size(16)]] = int16_t;
    const Signed values = Signed(sums);
    putPair(to, PixelPair((values & (values >= 0)) | (values > 255)));
}

/// The four colours that the pixels of a half choose from, in the order of their two-bit codes.
void makeShades(const PixelPair& base, uint32_t table, uint8_t* shades)
{
    const uint16_t small = STEPS[table & 7][0], large = STEPS[table & 7][1];
    const PixelPair steps = {small, small, small, 0, large, large, large, 0};
    putShades(shades, base + steps);
    putShades(shades + 2 * PIXEL_BYTES, base - steps);
}

/// The two-bit codes of the 16 pixels, column by column. The block stores all high bits first.
uint32_t interleaveCodes(uint32_t bits)
{
    uint64_t spread = uint64_t(bits >> 16) << 32 | (bits & 0xffff);
    spread = (spread | spread << 8) & 0x00ff00ff00ff00ff;
    spread = (spread | spread << 4) & 0x0f0f0f0f0f0f0f0f;
    spread = (spread | spread << 2) & 0x3333333333333333;
    spread = (spread | spread << 1) & 0x5555555555555555;
    return uint32_t(spread | spread >> 31);
}

void decodeBlock(const uint8_t* block, uint8_t* rgba, size_t stride)
{
    const uint32_t colours = readBigEndian(block);
    const bool isDifferential = colours & 2;
    const bool isFlipped = colours & 1; // halves above each other, else side by side

    constexpr uint32_t OPAQUE = 255;
    PixelPair first, second;
    if (isDifferential)
    {
        first = makePair(expand5(colours >> 27), expand5(colours >> 19), expand5(colours >> 11), OPAQUE);
        second =
            makePair(expandSum(colours >> 24), expandSum(colours >> 16), expandSum(colours >> 8), OPAQUE);
    }
    else
    {
        first = makePair(expand4(colours >> 28), expand4(colours >> 20), expand4(colours >> 12), OPAQUE);
        second = makePair(expand4(colours >> 24), expand4(colours >> 16), expand4(colours >> 8), OPAQUE);
    }

    uint8_t shades[2][SHADES * PIXEL_BYTES];
    makeShades(first, colours >> 5, shades[0]);
    makeShades(second, colours >> 2, shades[1]);

    uint32_t codes = interleaveCodes(readBigEndian(block + 4));
    for (unsigned x = 0; x < SIDE; ++x)
    {
        const uint8_t* upper = shades[isFlipped ? 0 : x / 2];
        const uint8_t* lower = shades[isFlipped ? 1 : x / 2];
        uint8_t* out = rgba + x * PIXEL_BYTES;
        std::memcpy(out, upper + (codes & 3) * PIXEL_BYTES, PIXEL_BYTES);
        std::memcpy(out + stride, upper + (codes >> 2 & 3) * PIXEL_BYTES, PIXEL_BYTES);
        std::memcpy(out + 2 * stride, lower + (codes >> 4 & 3) * PIXEL_BYTES, PIXEL_BYTES);
        std::memcpy(out + 3 * stride, lower + (codes >> 6 & 3) * PIXEL_BYTES, PIXEL_BYTES);
        codes >>= 8;
    }
}

} // namespace

uint64_t etc1Size(uint32_t width, uint32_t height)
{
    return (uint64_t(width) + 3) / 4 * ((uint64_t(height) + 3) / 4) * BLOCK_BYTES;
}

bool decodeEtc1(const uint8_t* data, size_t size, uint32_t width, uint32_t height, uint8_t* rgba)
{
    if (width == 0 || height == 0 || size < etc1Size(width, height))
        return false;

    const size_t stride = size_t(width) * PIXEL_BYTES;
    for (uint32_t y = 0; y < height; y += std::min(SIDE, height - y))
    {
        const uint32_t rows = std::min(SIDE, height - y);
        uint8_t* out = rgba + y * stride;
        for (uint32_t x = 0; x < width; x += std::min(SIDE, width - x))
        {
            const uint32_t columns = std::min(SIDE, width - x);
            if (rows == SIDE && columns == SIDE)
            {
                decodeBlock(data, out, stride);
            }
            else
            {
                uint8_t whole[SIDE * SIDE * PIXEL_BYTES];
                decodeBlock(data, whole, SIDE * PIXEL_BYTES);
                for (uint32_t row = 0; row < rows; ++row)
                    std::memcpy(out + row * stride, whole + row * SIDE * PIXEL_BYTES, columns * PIXEL_BYTES);
            }
            data += BLOCK_BYTES;
            out += SIDE * PIXEL_BYTES;
        }
    }
    return true;
}

} // namespace pvr
