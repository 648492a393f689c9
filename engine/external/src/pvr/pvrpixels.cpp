#include "pvr/pvrpixels.h"

#include "pvr/etc1.h"
#include "pvr/pvrtc.h"

#include <algorithm>
#include <cstring>

namespace pvr
{
namespace
{

bool decode(Format format, const uint8_t* data, const Level& level, uint8_t* rgba)
{
    const uint8_t* blocks = data + level.offset;
    if (format == Format::ETC1)
        return decodeEtc1(blocks, level.size, level.width, level.height, rgba);
    const PvrtcBits bits = getInfo(format).bitsPerPixel == 2 ? PvrtcBits::TWO : PvrtcBits::FOUR;
    return decodePvrtc(blocks, level.size, level.width, level.height, bits, rgba);
}

/// Turns 16-bit words of the file into words of this machine.
/// \param rotation bits to turn each word left by, which brings an alpha from the top to the bottom
void copyWords(const uint8_t* from, uint8_t* to, size_t bytes, bool bigEndian, unsigned rotation)
{
    for (size_t i = 0; i < bytes; i += 2)
    {
        const uint32_t high = from[i + (bigEndian ? 0 : 1)];
        const uint32_t low = from[i + (bigEndian ? 1 : 0)];
        const uint32_t word = high << 8 | low;
        const auto turned = uint16_t(word << rotation | word >> (16 - rotation));
        std::memcpy(to + i, &turned, sizeof(turned));
    }
}

void copyRow(const PvrFile& file, const uint8_t* from, uint8_t* to, size_t bytes)
{
    switch (file.format)
    {
    case Format::BGRA_8888:
        for (size_t i = 0; i < bytes; i += 4)
        {
            const uint8_t pixel[] = {from[i + 2], from[i + 1], from[i], from[i + 3]};
            std::memcpy(to + i, pixel, sizeof(pixel));
        }
        break;
    case Format::RGB_565:
    case Format::RGBA_4444:
    case Format::RGBA_5551: copyWords(from, to, bytes, file.bigEndian, 0); break;
    case Format::ARGB_4444: copyWords(from, to, bytes, file.bigEndian, 4); break;
    case Format::ARGB_1555: copyWords(from, to, bytes, file.bigEndian, 1); break;
    default: std::memcpy(to, from, bytes); break;
    }
}

void turnUpsideDown(uint8_t* pixels, size_t rowBytes, uint32_t height)
{
    for (uint32_t y = 0; y < height / 2; ++y)
    {
        uint8_t* row = pixels + y * rowBytes;
        std::swap_ranges(row, row + rowBytes, pixels + (height - 1 - y) * rowBytes);
    }
}

} // namespace

Format getUnpackedFormat(Format format)
{
    switch (format)
    {
    case Format::ARGB_4444: return Format::RGBA_4444;
    case Format::ARGB_1555: return Format::RGBA_5551;
    case Format::BGRA_8888: return Format::RGBA_8888;
    default: return getInfo(format).isCompressed() ? Format::RGBA_8888 : format;
    }
}

uint64_t getUnpackedSize(const PvrFile& file, const Level& level)
{
    // No overflow: the file holds at least two bits for each pixel.
    return uint64_t(level.width) * level.height * getInfo(getUnpackedFormat(file.format)).blockBytes;
}

bool unpack(const PvrFile& file, const uint8_t* data, const Level& level, uint8_t* pixels)
{
    const size_t rowBytes = size_t(level.width) * getInfo(getUnpackedFormat(file.format)).blockBytes;
    if (!getInfo(file.format).isCompressed())
    {
        for (uint32_t y = 0; y < level.height; ++y)
            copyRow(file, data + level.offset + y * rowBytes, pixels + y * rowBytes, rowBytes);
    }
    else if (!decode(file.format, data, level, pixels))
    {
        return false;
    }
    if (file.bottomRowFirst)
        turnUpsideDown(pixels, rowBytes, level.height);
    return true;
}

} // namespace pvr
