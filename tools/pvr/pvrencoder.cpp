#include "pvr/pvrencoder.h"

#include "pvr/pvrtc.h"

#include <ETC1/etc1.h>

#include <algorithm>
#include <cstdlib>

namespace pvr
{
namespace
{

/// An 8-bit channel rounded to fewer bits.
uint32_t reduce(unsigned value, unsigned bits)
{
    const unsigned most = (1u << bits) - 1;
    return (value * most + 127) / 255;
}

/// Channels of the given bits packed into a word, the first on top.
uint32_t pack(const uint8_t* rgba, const char* order, const unsigned (&bits)[4])
{
    uint32_t word = 0;
    for (unsigned i = 0; order[i]; ++i)
    {
        const unsigned channel = order[i] == 'r' ? 0 : order[i] == 'g' ? 1 : order[i] == 'b' ? 2 : 3;
        word = word << bits[i] | reduce(rgba[channel], bits[i]);
    }
    return word;
}

uint8_t getLuminance(const uint8_t* rgba)
{
    return uint8_t((77 * rgba[0] + 150 * rgba[1] + 29 * rgba[2] + 128) / 256);
}

std::vector<uint8_t> encodePixel(const uint8_t* rgba, Format format, bool bigEndian)
{
    uint32_t word = 0;
    switch (format)
    {
    case Format::RGBA_8888: return {rgba[0], rgba[1], rgba[2], rgba[3]};
    case Format::BGRA_8888: return {rgba[2], rgba[1], rgba[0], rgba[3]};
    case Format::RGB_888: return {rgba[0], rgba[1], rgba[2]};
    case Format::LA_88: return {getLuminance(rgba), rgba[3]};
    case Format::L_8: return {getLuminance(rgba)};
    case Format::A_8: return {rgba[3]};
    case Format::RGB_565: word = pack(rgba, "rgb", {5, 6, 5, 0}); break;
    case Format::RGBA_4444: word = pack(rgba, "rgba", {4, 4, 4, 4}); break;
    case Format::ARGB_4444: word = pack(rgba, "argb", {4, 4, 4, 4}); break;
    case Format::RGBA_5551: word = pack(rgba, "rgba", {5, 5, 5, 1}); break;
    case Format::ARGB_1555: word = pack(rgba, "argb", {1, 5, 5, 5}); break;
    default: return {}; // compressed
    }
    const auto high = uint8_t(word >> 8), low = uint8_t(word);
    return bigEndian ? std::vector<uint8_t>{high, low} : std::vector<uint8_t>{low, high};
}

std::vector<uint8_t> encodeEtc1(const SourcePicture& picture)
{
    std::vector<uint8_t> rgb;
    for (size_t i = 0; i < picture.rgba.size(); i += 4)
        rgb.insert(rgb.end(), &picture.rgba[i], &picture.rgba[i] + 3);
    std::vector<uint8_t> blocks(etc1_get_encoded_data_size(picture.width, picture.height));
    etc1_encode_image(rgb.data(), picture.width, picture.height, 3, 3 * picture.width, blocks.data());
    return blocks;
}

/// The index of a block: the bits of row and column interleaved, the row's first, and the longer side's remaining bits
/// above.
uint32_t getBlockIndex(uint32_t column, uint32_t row, uint32_t across, uint32_t down)
{
    uint32_t index = 0;
    unsigned bit = 0;
    for (uint32_t side = 1; side < across || side < down; side *= 2)
    {
        if (side < down)
            index |= (row & side ? 1u : 0u) << bit++;
        if (side < across)
            index |= (column & side ? 1u : 0u) << bit++;
    }
    return index;
}

int getBrightness(const uint8_t* rgba)
{
    return 2 * rgba[0] + 4 * rgba[1] + rgba[2] + 7 * rgba[3];
}

/// The half word of a block's darker (A) or brighter (B) colour. A has one bit of blue less.
uint32_t packColour(const uint8_t* rgba, bool isB)
{
    if (rgba[3] == 255)
        return 0x8000 | (isB ? pack(rgba, "rgb", {5, 5, 5, 0}) : pack(rgba, "rgb", {5, 5, 4, 0}) << 1);
    return isB ? pack(rgba, "argb", {3, 4, 4, 4}) : pack(rgba, "argb", {3, 4, 4, 3}) << 1;
}

/// A PVRTC image under construction: a word of modulation and one of colours for each block.
class PvrtcImage
{
public:
    PvrtcImage(const SourcePicture& picture, Format format)
        : m_picture(picture)
        , m_info(getInfo(format))
        , m_keepsAlpha(format == Format::PVRTC_2_RGBA || format == Format::PVRTC_4_RGBA)
        , m_across(std::max(picture.width / m_info.blockWidth, m_info.leastBlocks))
        , m_down(std::max(picture.height / m_info.blockHeight, m_info.leastBlocks))
        , m_bytes(size_t(m_across) * m_down * 8)
    {
    }

    std::vector<uint8_t> encode()
    {
        for (uint32_t row = 0; row < m_down; ++row)
        {
            for (uint32_t column = 0; column < m_across; ++column)
                setWord(column, row, 1, chooseColours(column, row));
        }
        const std::vector<uint8_t> a = decodeAll(0), b = decodeAll(0xffffffff);
        for (uint32_t row = 0; row < m_down; ++row)
        {
            for (uint32_t column = 0; column < m_across; ++column)
                setWord(column, row, 0, chooseModulation(column, row, a, b));
        }
        return m_bytes;
    }

private:
    void setWord(uint32_t column, uint32_t row, unsigned half, uint32_t word)
    {
        uint8_t* bytes = &m_bytes[getBlockIndex(column, row, m_across, m_down) * 8 + half * 4];
        for (unsigned i = 0; i < 4; ++i)
            bytes[i] = uint8_t(word >> 8 * i);
    }

    /// Pictures smaller than the image are repeated, as their edges are.
    void getPixel(uint32_t x, uint32_t y, uint8_t (&rgba)[4]) const
    {
        std::copy_n(m_picture.pixel(x % m_picture.width, y % m_picture.height), 4, rgba);
        if (!m_keepsAlpha)
            rgba[3] = 255;
    }

    uint32_t chooseColours(uint32_t column, uint32_t row) const
    {
        uint8_t darkest[4], brightest[4], rgba[4];
        getPixel(column * m_info.blockWidth, row * m_info.blockHeight, darkest);
        std::copy_n(darkest, 4, brightest);
        for (uint32_t y = 0; y < m_info.blockHeight; ++y)
        {
            for (uint32_t x = 0; x < m_info.blockWidth; ++x)
            {
                getPixel(column * m_info.blockWidth + x, row * m_info.blockHeight + y, rgba);
                if (getBrightness(rgba) < getBrightness(darkest))
                    std::copy_n(rgba, 4, darkest);
                if (getBrightness(rgba) > getBrightness(brightest))
                    std::copy_n(rgba, 4, brightest);
            }
        }
        const uint32_t mode = m_info.bitsPerPixel == 2 ? 1 : 0; // see chooseModulation()
        return packColour(brightest, true) << 16 | packColour(darkest, false) | mode;
    }

    /// The picture with one modulation word for all blocks: only colour A, or only B.
    std::vector<uint8_t> decodeAll(uint32_t modulation)
    {
        for (uint32_t row = 0; row < m_down; ++row)
        {
            for (uint32_t column = 0; column < m_across; ++column)
                setWord(column, row, 0, modulation);
        }
        std::vector<uint8_t> rgba(m_picture.rgba.size());
        decodePvrtc(m_bytes.data(), m_bytes.size(), m_picture.width, m_picture.height,
                    PvrtcBits(m_info.bitsPerPixel), rgba.data());
        return rgba;
    }

    /// The code whose mix of A and B is nearest to a pixel.
    /// \param step 1 for all codes, 3 for only A or B
    uint32_t chooseCode(uint32_t x, uint32_t y, const std::vector<uint8_t>& a, const std::vector<uint8_t>& b,
                        uint32_t step) const
    {
        static const int WEIGHTS[] = {0, 3, 5, 8};
        uint8_t wanted[4];
        getPixel(x, y, wanted);
        const size_t at = 4 * (size_t(y % m_picture.height) * m_picture.width + x % m_picture.width);

        uint32_t best = 0;
        int leastError = 4 * 256;
        for (uint32_t code = 0; code < 4; code += step)
        {
            int error = 0;
            for (size_t c = 0; c < 4; ++c)
            {
                const int mixed = (a[at + c] * (8 - WEIGHTS[code]) + b[at + c] * WEIGHTS[code]) / 8;
                error += std::abs(mixed - wanted[c]);
            }
            if (error < leastError)
            {
                leastError = error;
                best = code;
            }
        }
        return best;
    }

    /// With 4 bits, a two-bit code for each pixel. With 2 bits, codes for every other pixel in a chequerboard, from
    /// which the decoder interpolates the rest; the lowest bit marks this mode, so the first pixel has only two codes.
    uint32_t chooseModulation(uint32_t column, uint32_t row, const std::vector<uint8_t>& a,
                              const std::vector<uint8_t>& b) const
    {
        const uint32_t stride = m_info.bitsPerPixel == 4 ? 1 : 2;
        uint32_t word = 0;
        unsigned bit = 0;
        for (uint32_t y = 0; y < m_info.blockHeight; ++y)
        {
            for (uint32_t x = y % stride; x < m_info.blockWidth; x += stride, bit += 2)
            {
                const uint32_t step = stride == 2 && bit == 0 ? 3 : 1;
                word |= chooseCode(column * m_info.blockWidth + x, row * m_info.blockHeight + y, a, b, step)
                        << bit;
            }
        }
        return stride == 2 ? word & ~1u : word;
    }

    const SourcePicture& m_picture;
    const FormatInfo& m_info;
    bool m_keepsAlpha;
    uint32_t m_across;
    uint32_t m_down;
    std::vector<uint8_t> m_bytes;
};

} // namespace

std::vector<uint8_t> encode(const SourcePicture& picture, Format format, bool bigEndian)
{
    if (format == Format::ETC1)
        return encodeEtc1(picture);
    if (getInfo(format).isPvrtc())
        return PvrtcImage(picture, format).encode();

    std::vector<uint8_t> bytes;
    for (size_t i = 0; i < picture.rgba.size(); i += 4)
    {
        const std::vector<uint8_t> pixel = encodePixel(&picture.rgba[i], format, bigEndian);
        bytes.insert(bytes.end(), pixel.begin(), pixel.end());
    }
    return bytes;
}

} // namespace pvr
