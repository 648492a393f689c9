#include "pvr/pvrfile.h"

#include "pvr/pvrcodes.h"

#include <algorithm>
#include <cinttypes>
#include <cstdarg>
#include <cstdio>

namespace pvr
{
namespace
{

/// Sets the error and returns false.
__attribute__((format(printf, 2, 3))) bool refuse(std::string& error, const char* text, ...)
{
    char line[200];
    va_list arguments;
    va_start(arguments, text);
    std::vsnprintf(line, sizeof(line), text, arguments);
    va_end(arguments);
    error = line;
    return false;
}

/// The words of a header. The caller has made sure that they are there.
class Words
{
public:
    Words(const uint8_t* data, bool bigEndian) : m_data(data), m_bigEndian(bigEndian) {}

    uint32_t operator[](unsigned index) const
    {
        const uint8_t* bytes = m_data + 4 * index;
        uint32_t word = 0;
        for (unsigned i = 0; i < 4; ++i)
            word |= uint32_t(bytes[i]) << 8 * (m_bigEndian ? 3 - i : i);
        return word;
    }

    uint64_t readLong(unsigned index) const
    {
        const uint64_t first = (*this)[index];
        const uint64_t second = (*this)[index + 1];
        return m_bigEndian ? first << 32 | second : second << 32 | first;
    }

private:
    const uint8_t* m_data;
    bool m_bigEndian;
};

bool identify(const uint8_t* data, size_t size, Header& header, bool& bigEndian)
{
    if (size < 4)
        return false;
    for (const bool order : {false, true})
    {
        bigEndian = order;
        switch (Words(data, order)[0])
        {
        case 44: header = Header::LEGACY_44; return true;
        case 52: header = Header::LEGACY_52; return true;
        case version3::VERSION_VALUE: header = Header::VERSION_3; return true;
        default: break;
        }
    }
    return false;
}

/// The picture as the header describes it; the file's length is checked later.
struct PictureInfo
{
    Format format = Format::RGBA_8888;
    bool bottomRowFirst = false;
    uint32_t width = 0;
    uint32_t height = 0;
    uint64_t levelCount = 0;
    uint64_t dataOffset = 0;
    uint32_t surfaceSize = 0; ///< 0 if unknown
};

struct Name
{
    uint32_t code;
    const char* text;
};

template <size_t N>
const char* findName(const Name (&names)[N], uint64_t code)
{
    const auto isOfCode = [code](const Name& name) { return name.code == code; };
    const Name* found = std::find_if(names, names + N, isOfCode);
    return found == names + N ? "unknown" : found->text;
}

constexpr Name REFUSED_LEGACY_TYPES[] = {{0x03, "RGB 555"},
                                         {0x04, "RGB 888 of the older kind"},
                                         {0x06, "ARGB 8332"},
                                         {0x09, "one bit per pixel"},
                                         {0x0a, "VY1UY0"},
                                         {0x0b, "Y1VY0U"},
                                         {0x14, "RGB 555"},
                                         {0x1c, "PVRTC-II 4 bpp"},
                                         {0x1d, "PVRTC-II 2 bpp"},
                                         {0x20, "DXT1"},
                                         {0x21, "DXT2"},
                                         {0x22, "DXT3"},
                                         {0x23, "DXT4"},
                                         {0x24, "DXT5"},
                                         {0x37, "ETC with explicit alpha"},
                                         {0x38, "ETC with interpolated alpha"}};

constexpr Name REFUSED_FORMATS[] = {{4, "PVRTC-II 2 bpp"},
                                    {5, "PVRTC-II 4 bpp"},
                                    {7, "DXT1"},
                                    {8, "DXT2"},
                                    {9, "DXT3"},
                                    {10, "DXT4"},
                                    {11, "DXT5"},
                                    {12, "BC4"},
                                    {13, "BC5"},
                                    {14, "BC6"},
                                    {15, "BC7"},
                                    {16, "UYVY"},
                                    {17, "YUY2"},
                                    {18, "one bit per pixel"},
                                    {19, "RGB 999 with shared exponent"},
                                    {20, "RGBG 8888"},
                                    {21, "GRGB 8888"},
                                    {22, "ETC2 RGB"},
                                    {23, "ETC2 RGBA"},
                                    {24, "ETC2 RGB A1"},
                                    {25, "EAC R11"},
                                    {26, "EAC RG11"}};

bool findLegacyFormat(uint32_t flags, uint32_t alphaMask, Format& format, std::string& error)
{
    const uint32_t code = flags & legacy::TYPE;
    for (const legacy::PixelType& type : legacy::PIXEL_TYPES)
    {
        if (type.code != code)
            continue;
        format = type.format;
        if (getInfo(format).isPvrtc() && (alphaMask != 0 || (flags & legacy::HAS_ALPHA)))
            format = format == Format::PVRTC_2_RGB ? Format::PVRTC_2_RGBA : Format::PVRTC_4_RGBA;
        return true;
    }
    return refuse(error, "pixel type 0x%02x (%s) is not supported", code,
                  findName(REFUSED_LEGACY_TYPES, code));
}

bool readLegacy(const Words& words, Header header, PictureInfo& picture, std::string& error)
{
    const bool hasTag = header == Header::LEGACY_52;
    if (hasTag && words[legacy::TAG] != legacy::TAG_VALUE)
        return refuse(error, "tag is 0x%08x, not \"PVR!\"", words[legacy::TAG]);

    const uint32_t flags = words[legacy::FLAGS];
    if (!findLegacyFormat(flags, words[legacy::ALPHA_MASK], picture.format, error))
        return false;
    const FormatInfo& info = getInfo(picture.format);
    if (flags & legacy::CUBE)
        return refuse(error, "flags 0x%x: cube maps are no 2D textures", flags);
    if (flags & legacy::VOLUME)
        return refuse(error, "flags 0x%x: volumes are no 2D textures", flags);
    if ((flags & legacy::TWIDDLED) && !info.isPvrtc())
        return refuse(error, "flags 0x%x: twiddled pixels of %s are not supported", flags, info.name);
    if (hasTag && words[legacy::SURFACES] > 1)
        return refuse(error, "number of surfaces is %u: arrays are no 2D textures", words[legacy::SURFACES]);
    const uint32_t bits = words[legacy::BIT_COUNT];
    if (bits != 0 && bits != info.bitsPerPixel)
        return refuse(error, "bit count is %u, but a pixel of %s has %u", bits, info.name, info.bitsPerPixel);

    picture.bottomRowFirst = flags & legacy::BOTTOM_ROW_FIRST;
    picture.width = words[legacy::WIDTH];
    picture.height = words[legacy::HEIGHT];
    picture.levelCount = uint64_t(words[legacy::MIPMAPS]) + 1;
    picture.dataOffset = HEADER_BYTES[unsigned(header)];
    picture.surfaceSize = words[legacy::SURFACE_SIZE];
    return true;
}

bool findFormat(uint64_t value, Format& format, std::string& error)
{
    const uint64_t* end = version3::FORMAT_VALUES + FORMAT_COUNT;
    const uint64_t* found = std::find(version3::FORMAT_VALUES, end, value);
    if (found != end)
    {
        format = Format(found - version3::FORMAT_VALUES);
        return true;
    }
    if (value >> 32 == 0)
    {
        const bool isAstc = value >= 27 && value <= 50;
        return refuse(error, "pixel format %" PRIu64 " (%s) is not supported", value,
                      isAstc ? "ASTC" : findName(REFUSED_FORMATS, value));
    }

    std::string channels;
    for (unsigned i = 0; i < 4; ++i)
    {
        const auto letter = char(value >> 8 * i & 0xff);
        if (letter >= 'a' && letter <= 'z')
            channels += ' ' + (letter + std::to_string(value >> (32 + 8 * i) & 0xff));
    }
    return refuse(error, "pixel format 0x%016" PRIx64 " (channels%s) is not supported", value,
                  channels.c_str());
}

bool readVersion3(const Words& words, PictureInfo& picture, std::string& error)
{
    if (!findFormat(words.readLong(version3::FORMAT), picture.format, error))
        return false;
    if (words[version3::COLOUR_SPACE] > 1)
        return refuse(error, "colour space is %u (can be 0 or 1)", words[version3::COLOUR_SPACE]);
    const uint32_t type = words[version3::CHANNEL_TYPE];
    if (type != version3::UNSIGNED_BYTE && type != version3::UNSIGNED_SHORT &&
        type != version3::UNSIGNED_INTEGER)
        return refuse(error, "channel type is %u (can be unsigned and normalised: 0, 4 or 8)", type);
    if (words[version3::DEPTH] != 1)
        return refuse(error, "depth is %u: volumes are no 2D textures", words[version3::DEPTH]);
    if (words[version3::SURFACES] != 1)
        return refuse(error, "number of surfaces is %u: arrays are no 2D textures",
                      words[version3::SURFACES]);
    if (words[version3::FACES] != 1)
        return refuse(error, "number of faces is %u: cube maps are no 2D textures", words[version3::FACES]);

    picture.width = words[version3::WIDTH];
    picture.height = words[version3::HEIGHT];
    picture.levelCount = words[version3::LEVELS];
    picture.dataOffset = HEADER_BYTES[unsigned(Header::VERSION_3)] + uint64_t(words[version3::METADATA_SIZE]);
    return true;
}

bool isPowerOfTwo(uint32_t value)
{
    return (value & (value - 1)) == 0;
}

bool checkSides(const PictureInfo& picture, std::string& error)
{
    if (picture.width == 0)
        return refuse(error, "width is 0");
    if (picture.height == 0)
        return refuse(error, "height is 0");
    const FormatInfo& info = getInfo(picture.format);
    if (info.isPvrtc() && !(isPowerOfTwo(picture.width) && isPowerOfTwo(picture.height)))
        return refuse(error, "width and height are %u and %u: the sides of %s are powers of two",
                      picture.width, picture.height, info.name);

    uint64_t most = 0;
    for (uint32_t side = std::max(picture.width, picture.height); side != 0; side /= 2)
        ++most;
    if (picture.levelCount == 0 || picture.levelCount > most)
        return refuse(error, "mipmap count makes %" PRIu64 " levels, but %u x %u pixels have 1 to %" PRIu64,
                      picture.levelCount, picture.width, picture.height, most);
    return true;
}

uint64_t countBlocks(const FormatInfo& info, uint32_t width, uint32_t height)
{
    const uint64_t across = (uint64_t(width) + info.blockWidth - 1) / info.blockWidth;
    const uint64_t down = (uint64_t(height) + info.blockHeight - 1) / info.blockHeight;
    const uint64_t least = info.leastBlocks;
    return std::max(across, least) * std::max(down, least);
}

/// Lays the levels one behind the other.
bool layOut(const PictureInfo& picture, uint64_t size, std::vector<Level>& levels, std::string& error)
{
    const FormatInfo& info = getInfo(picture.format);
    if (picture.dataOffset > size)
        return refuse(error, "metadata size lets the pixels begin at byte %" PRIu64 " of %" PRIu64,
                      picture.dataOffset, size);
    uint64_t offset = picture.dataOffset;
    for (unsigned i = 0; i < picture.levelCount; ++i)
    {
        const uint32_t width = std::max(picture.width >> i, 1u);
        const uint32_t height = std::max(picture.height >> i, 1u);
        const uint64_t blocks = countBlocks(info, width, height);
        if (blocks > (size - offset) / info.blockBytes) // the product of the two may be more than 64 bits
            return refuse(error, "level %u, %u x %u pixels of %s, is cut off after %" PRIu64 " bytes", i,
                          width, height, info.name, size - offset);
        levels.push_back({width, height, size_t(offset), size_t(blocks * info.blockBytes)});
        offset += blocks * info.blockBytes;
    }
    const uint64_t needed = offset - picture.dataOffset;
    if (picture.surfaceSize != 0 && picture.surfaceSize < needed)
        return refuse(error, "surface size is %u, but the levels take %" PRIu64 " bytes", picture.surfaceSize,
                      needed);
    return true;
}

} // namespace

bool isPvr(const uint8_t* data, size_t size)
{
    Header header;
    bool bigEndian;
    return identify(data, size, header, bigEndian);
}

bool parse(const uint8_t* data, size_t size, PvrFile& file, std::string& error)
{
    Header header;
    bool bigEndian;
    if (!identify(data, size, header, bigEndian))
        return refuse(error, "header is not that of a PVR file");
    if (size < HEADER_BYTES[unsigned(header)])
        return refuse(error, "header is cut off after %zu of %u bytes", size, HEADER_BYTES[unsigned(header)]);

    const Words words(data, bigEndian);
    PictureInfo picture;
    const bool isRead = header == Header::VERSION_3 ? readVersion3(words, picture, error)
                                                    : readLegacy(words, header, picture, error);
    std::vector<Level> levels;
    if (!isRead || !checkSides(picture, error) || !layOut(picture, size, levels, error))
        return false;

    file.format = picture.format;
    file.bigEndian = bigEndian;
    file.bottomRowFirst = picture.bottomRowFirst;
    file.levels.swap(levels);
    return true;
}

} // namespace pvr
