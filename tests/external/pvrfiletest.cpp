#include "pvr/pvrfile.h"

#include "pvr/pvrpixels.h"
#include "pvr/pvrwriter.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <memory>

using namespace pvr;

namespace
{

using Bytes = std::vector<uint8_t>;

constexpr Header HEADERS[] = {Header::LEGACY_44, Header::LEGACY_52, Header::VERSION_3};

/// Different in every pixel and channel, not symmetric.
SourcePicture makePicture(uint32_t width, uint32_t height)
{
    SourcePicture picture{width, height, {}};
    for (uint32_t y = 0; y < height; ++y)
    {
        for (uint32_t x = 0; x < width; ++x)
        {
            for (const uint32_t value : {x * 255 / width, y * 255 / height, (x + y) * 5, 255 - x * 9})
                picture.rgba.push_back(uint8_t(value));
        }
    }
    return picture;
}

Bytes setWord(Bytes file, unsigned index, uint32_t value, bool bigEndian = false)
{
    for (unsigned i = 0; i < 4; ++i)
        file[4 * index + i] = uint8_t(value >> 8 * (bigEndian ? 3 - i : i));
    return file;
}

/// The reason why a file is refused; "" if it is not. The bytes lie at the end of an allocation of their own, so
/// that a sanitizer sees any read beyond them.
std::string whyRefused(const Bytes& bytes)
{
    const auto copy = std::make_unique<uint8_t[]>(bytes.size());
    std::copy(bytes.begin(), bytes.end(), copy.get());
    PvrFile file;
    std::string error;
    if (!parse(copy.get(), bytes.size(), file, error))
    {
        EXPECT_NE("", error);
        EXPECT_TRUE(file.levels.empty());
        return error;
    }
    for (const Level& level : file.levels)
    {
        Bytes pixels(size_t(getUnpackedSize(file, level)));
        EXPECT_TRUE(unpack(file, copy.get(), level, pixels.data()));
    }
    return "";
}

Bytes unpackLevel(const Bytes& bytes, size_t index)
{
    PvrFile file;
    std::string error;
    if (!parse(bytes.data(), bytes.size(), file, error) || index >= file.levels.size())
    {
        ADD_FAILURE() << error;
        return {};
    }
    Bytes pixels(size_t(getUnpackedSize(file, file.levels[index])));
    EXPECT_TRUE(unpack(file, bytes.data(), file.levels[index], pixels.data()));
    return pixels;
}

} // namespace

// Faults caught: a pixel type or channel code read as another format, words of the other byte order, levels taken
// from the wrong place, metadata taken for pixels, a picture upside down.
TEST(PvrFile, everyHeaderAndByteOrderGivesTheSamePixels)
{
    const WriteOptions variants[] = {{Header::LEGACY_44, false},
                                     {Header::LEGACY_44, true},
                                     {Header::LEGACY_52, false},
                                     {Header::LEGACY_52, true},
                                     {Header::VERSION_3, false},
                                     {Header::VERSION_3, true, true, false, Bytes(5, 77)},
                                     {Header::LEGACY_44, true, true, true},
                                     {Header::LEGACY_52, false, true, true}};
    const SourcePicture picture = makePicture(16, 8);
    for (unsigned i = 0; i < FORMAT_COUNT; ++i)
    {
        const auto format = Format(i);
        SCOPED_TRACE(getInfo(format).name);
        const Bytes plain = write(picture, format);
        for (const WriteOptions& variant : variants)
        {
            if (variant.bottomRowFirst && getInfo(format).isCompressed())
                continue; // a picture upside down is encoded in other ways
            SCOPED_TRACE(&variant - variants);
            const Bytes bytes = write(picture, format, variant);
            PvrFile file;
            std::string error;
            ASSERT_TRUE(parse(bytes.data(), bytes.size(), file, error)) << error;
            EXPECT_EQ(format, file.format);
            EXPECT_EQ(16u, file.width());
            EXPECT_EQ(8u, file.height());
            EXPECT_EQ(5u, file.levels.size());
            EXPECT_TRUE(file.isComplete());
            EXPECT_EQ(bytes.size(), file.levels.back().offset + file.levels.back().size);
            for (const size_t level : {0, 2})
                EXPECT_TRUE(unpackLevel(plain, level) == unpackLevel(bytes, level)) << level;
        }
    }
}

// Fault caught: channels in the wrong order or of the wrong width (the writer shares no pixel code with the reader,
// but these bytes are written by hand).
TEST(PvrFile, pixelsByHand)
{
    const struct
    {
        Format format;
        Bytes stored;   ///< two pixels, little-endian
        Bytes unpacked; ///< as a little-endian machine has it
    } cases[] = {
        {Format::BGRA_8888, {1, 2, 3, 4, 5, 6, 7, 8}, {3, 2, 1, 4, 7, 6, 5, 8}},
        {Format::RGB_888, {1, 2, 3, 4, 5, 6}, {1, 2, 3, 4, 5, 6}},
        {Format::RGB_565, {0x34, 0x12, 0x78, 0x56}, {0x34, 0x12, 0x78, 0x56}},
        {Format::ARGB_4444, {0x34, 0x12, 0xbc, 0xfa}, {0x41, 0x23, 0xcf, 0xab}},
        {Format::ARGB_1555, {0x01, 0x80, 0x00, 0x40}, {0x03, 0x00, 0x00, 0x80}},
        {Format::LA_88, {1, 2, 3, 4}, {1, 2, 3, 4}},
    };
    for (const auto& test : cases)
    {
        Bytes file = write(makePicture(2, 1), test.format, {.hasMipmaps = false});
        std::copy(test.stored.begin(), test.stored.end(), file.begin() + 52);
        EXPECT_EQ(test.unpacked, unpackLevel(file, 0)) << getInfo(test.format).name;
    }
}

// Fault caught: a field that is trusted. The reason of a refusal names the field or the format.
TEST(PvrFile, everyFieldOutOfRange)
{
    using namespace legacy;
    const uint32_t huge = 0xffffffff;
    const uint32_t rgba = 0x12;
    const struct
    {
        Header header;
        unsigned word;
        uint32_t value;
        const char* reason; ///< "" if the field may have the value
    } cases[] = {
        {Header::LEGACY_52, HEADER_SIZE, 51, "header is not"},
        {Header::LEGACY_44, HEADER_SIZE, 0, "header is not"},
        {Header::LEGACY_52, HEIGHT, 0, "height is 0"},
        {Header::LEGACY_52, WIDTH, 0, "width is 0"},
        {Header::LEGACY_52, HEIGHT, huge, "level 0, 8 x 4294967295 pixels"},
        {Header::LEGACY_44, WIDTH, huge, "level 0, 4294967295 x 8 pixels"},
        {Header::LEGACY_52, WIDTH, 0x20000000, "level 0"}, // 2^34 bytes, which is 0 in 32 bits
        {Header::LEGACY_52, MIPMAPS, 4, "mipmap count makes 5 levels"},
        {Header::LEGACY_52, MIPMAPS, huge, "mipmap count makes 4294967296 levels"},
        {Header::LEGACY_52, MIPMAPS, 2, ""},
        {Header::LEGACY_52, FLAGS, 0x14, "pixel type 0x14 (RGB 555)"},
        {Header::LEGACY_52, FLAGS, 0x1c, "PVRTC-II 4 bpp"},
        {Header::LEGACY_44, FLAGS, 0x24, "DXT5"},
        {Header::LEGACY_52, FLAGS, 0xff, "pixel type 0xff (unknown)"},
        {Header::LEGACY_52, FLAGS, rgba | CUBE, "cube maps"},
        {Header::LEGACY_44, FLAGS, rgba | VOLUME, "volumes"},
        {Header::LEGACY_52, FLAGS, rgba | TWIDDLED, "twiddled"},
        {Header::LEGACY_52, SURFACE_SIZE, 339, "surface size is 339, but the levels take 340 bytes"},
        {Header::LEGACY_52, SURFACE_SIZE, 0, ""},
        {Header::LEGACY_52, BIT_COUNT, 24, "bit count is 24"},
        {Header::LEGACY_52, BIT_COUNT, 0, ""},
        {Header::LEGACY_52, TAG, 0, "tag is 0x00000000"},
        {Header::LEGACY_52, SURFACES, 6, "number of surfaces is 6"},
        {Header::LEGACY_52, SURFACES, 0, ""},
        {Header::VERSION_3, version3::VERSION, 0x04525650, "header is not"},
        {Header::VERSION_3, version3::FLAGS, huge, ""},
        {Header::VERSION_3, version3::FORMAT, 0, "pixel format 0x0808080800000000"},
        {Header::VERSION_3, version3::FORMAT + 1, 0x10101010, "channels r16 g16 b16 a16"},
        {Header::VERSION_3, version3::COLOUR_SPACE, 1, ""},
        {Header::VERSION_3, version3::COLOUR_SPACE, 2, "colour space is 2"},
        {Header::VERSION_3, version3::CHANNEL_TYPE, 12, "channel type is 12"},
        {Header::VERSION_3, version3::HEIGHT, 0, "height is 0"},
        {Header::VERSION_3, version3::WIDTH, 0, "width is 0"},
        {Header::VERSION_3, version3::WIDTH, huge, "level 0"},
        {Header::VERSION_3, version3::DEPTH, 0, "depth is 0"},
        {Header::VERSION_3, version3::DEPTH, 2, "depth is 2: volumes"},
        {Header::VERSION_3, version3::SURFACES, 0, "number of surfaces is 0"},
        {Header::VERSION_3, version3::SURFACES, 4, "number of surfaces is 4: arrays"},
        {Header::VERSION_3, version3::FACES, 6, "number of faces is 6: cube maps"},
        {Header::VERSION_3, version3::LEVELS, 0, "mipmap count makes 0 levels"},
        {Header::VERSION_3, version3::LEVELS, 5, "mipmap count makes 5 levels"},
        {Header::VERSION_3, version3::METADATA_SIZE, huge, "metadata size"},
        {Header::VERSION_3, version3::METADATA_SIZE, 1, "level 3, 1 x 1 pixels of RGBA 8888, is cut off"},
    };
    for (const auto& test : cases)
    {
        for (const bool bigEndian : {false, true})
        {
            const Bytes file = write(makePicture(8, 8), Format::RGBA_8888, {test.header, bigEndian});
            unsigned word = test.word;
            if (test.header == Header::VERSION_3 && bigEndian && word / 2 == version3::FORMAT / 2)
                word ^= 1; // the two halves of the format change places
            const std::string reason = whyRefused(setWord(file, word, test.value, bigEndian));
            const bool isAsExpected =
                *test.reason ? reason.find(test.reason) != std::string::npos : reason.empty();
            EXPECT_TRUE(isAsExpected) << "word " << test.word << " = " << test.value << ": " << reason
                                      << "; expected: " << test.reason;
        }
    }
}

// Faults caught: a product of sides that wraps at 64 bits, and PVRTC sizes that its decoder does not know.
TEST(PvrFile, sidesOfCompressedPictures)
{
    const struct
    {
        Format format;
        uint32_t width, height;
        const char* reason;
    } cases[] = {
        {Format::ETC1, 0xffffffff, 0xffffffff, "level 0"},
        {Format::ETC1, 7, 8, "is cut off"}, // the smaller levels of 8 x 8 are shorter
        {Format::PVRTC_4_RGB, 0x80000000, 0x80000000, "level 0"},
        {Format::PVRTC_4_RGBA, 24, 16, "width and height are 24 and 16: the sides of PVRTC 4 bpp RGBA"},
        {Format::PVRTC_2_RGB, 16, 3, "width and height are 16 and 3"},
    };
    for (const auto& test : cases)
    {
        Bytes file = write(makePicture(8, 4), test.format, {.hasMipmaps = false});
        file = setWord(setWord(file, version3::WIDTH, test.width), version3::HEIGHT, test.height);
        EXPECT_NE(std::string::npos, whyRefused(file).find(test.reason)) << whyRefused(file);
    }
    for (const uint64_t format : {4, 5, 22, 23, 24, 25, 26, 27, 50, 51})
    {
        const Bytes file = setWord(setWord(write(makePicture(8, 8), Format::L_8), version3::FORMAT + 1, 0),
                                   version3::FORMAT, uint32_t(format));
        const char* name = format < 6    ? "PVRTC-II"
                           : format < 25 ? "ETC2"
                           : format < 27 ? "EAC"
                           : format < 51 ? "ASTC"
                                         : "unknown";
        EXPECT_NE(std::string::npos, whyRefused(file).find(name)) << format;
    }
}

// Fault caught: a read beyond what is there (under the sanitizers), or a short file taken for a whole one.
TEST(PvrFile, cutAtEveryByte)
{
    for (const Header header : HEADERS)
    {
        for (const Format format : {Format::RGB_565, Format::ETC1, Format::PVRTC_2_RGBA})
        {
            const Bytes file = write(makePicture(16, 8), format, {header, false, true, false, Bytes(7)});
            for (size_t length = 0; length < file.size(); ++length)
                EXPECT_NE("", whyRefused(Bytes(file.begin(), file.begin() + ptrdiff_t(length)))) << length;
            EXPECT_EQ("", whyRefused(file));
        }
    }
}
