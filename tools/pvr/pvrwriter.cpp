#include "pvr/pvrwriter.h"

#include <algorithm>
#include <cstddef>

namespace pvr
{
namespace
{

/// The words of a header, all 0 until set.
class Words
{
public:
    Words(Header header, bool bigEndian) : m_words(HEADER_BYTES[unsigned(header)] / 4), m_bigEndian(bigEndian)
    {
    }

    uint32_t& operator[](unsigned index) { return m_words[index]; }

    void setLong(unsigned index, uint64_t value)
    {
        m_words[index] = uint32_t(m_bigEndian ? value >> 32 : value);
        m_words[index + 1] = uint32_t(m_bigEndian ? value : value >> 32);
    }

    std::vector<uint8_t> toBytes() const
    {
        std::vector<uint8_t> bytes;
        for (const uint32_t word : m_words)
        {
            for (int i = 0; i < 4; ++i)
                bytes.push_back(uint8_t(word >> 8 * (m_bigEndian ? 3 - i : i)));
        }
        return bytes;
    }

private:
    std::vector<uint32_t> m_words;
    bool m_bigEndian;
};

bool hasAlpha(Format format)
{
    return format == Format::PVRTC_2_RGBA || format == Format::PVRTC_4_RGBA;
}

uint32_t getLegacyCode(Format format)
{
    const Format listed = format == Format::PVRTC_2_RGBA   ? Format::PVRTC_2_RGB
                          : format == Format::PVRTC_4_RGBA ? Format::PVRTC_4_RGB
                                                           : format;
    const auto* type = std::find_if(std::begin(legacy::PIXEL_TYPES), std::end(legacy::PIXEL_TYPES),
                                    [=](const legacy::PixelType& entry) { return entry.format == listed; });
    return type->code; // every format but those two is in the table
}

std::vector<uint8_t> writeLegacyHeader(const SourcePicture& picture, Format format,
                                       const WriteOptions& options, uint32_t mipmaps, uint32_t dataBytes)
{
    Words words(options.header, options.bigEndian);
    words[legacy::HEADER_SIZE] = HEADER_BYTES[unsigned(options.header)];
    words[legacy::HEIGHT] = picture.height;
    words[legacy::WIDTH] = picture.width;
    words[legacy::MIPMAPS] = mipmaps;
    words[legacy::FLAGS] = getLegacyCode(format) | (mipmaps ? legacy::HAS_MIPMAPS : 0) |
                           (hasAlpha(format) ? legacy::HAS_ALPHA : 0) |
                           (options.bottomRowFirst ? legacy::BOTTOM_ROW_FIRST : 0);
    words[legacy::SURFACE_SIZE] = dataBytes;
    words[legacy::BIT_COUNT] = getInfo(format).bitsPerPixel;
    words[legacy::ALPHA_MASK] = hasAlpha(format) ? 1 : 0;
    if (options.header == Header::LEGACY_52)
    {
        words[legacy::TAG] = legacy::TAG_VALUE;
        words[legacy::SURFACES] = 1;
    }
    return words.toBytes();
}

std::vector<uint8_t> writeVersion3Header(const SourcePicture& picture, Format format,
                                         const WriteOptions& options, uint32_t mipmaps)
{
    const FormatInfo& info = getInfo(format);
    const bool isPacked = info.bitsPerPixel == 16 && format != Format::LA_88;
    Words words(options.header, options.bigEndian);
    words[version3::VERSION] = version3::VERSION_VALUE;
    words.setLong(version3::FORMAT, version3::FORMAT_VALUES[unsigned(format)]);
    words[version3::CHANNEL_TYPE] = isPacked ? version3::UNSIGNED_SHORT : version3::UNSIGNED_BYTE;
    words[version3::HEIGHT] = picture.height;
    words[version3::WIDTH] = picture.width;
    words[version3::DEPTH] = 1;
    words[version3::SURFACES] = 1;
    words[version3::FACES] = 1;
    words[version3::LEVELS] = mipmaps + 1;
    words[version3::METADATA_SIZE] = uint32_t(options.metadata.size());
    std::vector<uint8_t> bytes = words.toBytes();
    bytes.insert(bytes.end(), options.metadata.begin(), options.metadata.end());
    return bytes;
}

SourcePicture turnUpsideDown(SourcePicture picture)
{
    const size_t rowBytes = size_t(picture.width) * 4;
    for (uint32_t y = 0; y < picture.height / 2; ++y)
    {
        const auto row = picture.rgba.begin() + ptrdiff_t(y * rowBytes);
        std::swap_ranges(row, row + ptrdiff_t(rowBytes),
                         picture.rgba.begin() + ptrdiff_t((picture.height - 1 - y) * rowBytes));
    }
    return picture;
}

} // namespace

SourcePicture halve(const SourcePicture& picture)
{
    SourcePicture half{std::max(picture.width / 2, 1u), std::max(picture.height / 2, 1u), {}};
    for (uint32_t y = 0; y < half.height; ++y)
    {
        for (uint32_t x = 0; x < half.width; ++x)
        {
            const uint32_t left = std::min(2 * x, picture.width - 1),
                           top = std::min(2 * y, picture.height - 1);
            const uint32_t right = std::min(left + 1, picture.width - 1);
            const uint32_t bottom = std::min(top + 1, picture.height - 1);
            for (unsigned c = 0; c < 4; ++c)
            {
                const int sum = picture.pixel(left, top)[c] + picture.pixel(right, top)[c] +
                                picture.pixel(left, bottom)[c] + picture.pixel(right, bottom)[c];
                half.rgba.push_back(uint8_t((sum + 2) / 4));
            }
        }
    }
    return half;
}

std::vector<uint8_t> write(const SourcePicture& picture, Format format, const WriteOptions& options)
{
    uint32_t mipmaps = 0;
    std::vector<uint8_t> data;
    for (SourcePicture level = options.bottomRowFirst ? turnUpsideDown(picture) : picture;;
         level = halve(level))
    {
        const std::vector<uint8_t> bytes = encode(level, format, options.bigEndian);
        data.insert(data.end(), bytes.begin(), bytes.end());
        if (!options.hasMipmaps || (level.width == 1 && level.height == 1))
            break;
        ++mipmaps;
    }

    std::vector<uint8_t> file =
        options.header == Header::VERSION_3
            ? writeVersion3Header(picture, format, options, mipmaps)
            : writeLegacyHeader(picture, format, options, mipmaps, uint32_t(data.size()));
    file.insert(file.end(), data.begin(), data.end());
    return file;
}

} // namespace pvr
