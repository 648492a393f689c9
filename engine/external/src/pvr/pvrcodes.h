#pragma once

#include "pvr/pvrformat.h"

/// The encoding of PVR headers, shared by reader and writer.
///
/// A header is a row of 32-bit words, all of them in the byte order of the machine that wrote the file.
namespace pvr
{

enum class Header : uint8_t
{
    LEGACY_44, ///< ends before the tag
    LEGACY_52, ///< with the tag "PVR!"
    VERSION_3
};

inline constexpr unsigned HEADER_BYTES[] = {44, 52, 52}; ///< indexed by Header

// --- Legacy headers ------------------------------------------------------------------------------------------

/// Word numbers.
namespace legacy
{
inline constexpr unsigned HEADER_SIZE = 0; ///< 44 or 52
inline constexpr unsigned HEIGHT = 1;
inline constexpr unsigned WIDTH = 2;
inline constexpr unsigned MIPMAPS = 3; ///< beyond the largest level
inline constexpr unsigned FLAGS = 4;
inline constexpr unsigned SURFACE_SIZE = 5; ///< bytes of all levels
inline constexpr unsigned BIT_COUNT = 6;    ///< of a pixel
inline constexpr unsigned RED_MASK = 7;     ///< then green and blue
inline constexpr unsigned ALPHA_MASK = 10;
inline constexpr unsigned TAG = 11;
inline constexpr unsigned SURFACES = 12;

inline constexpr uint32_t TAG_VALUE = 0x21525650; ///< "PVR!"

// Bits of the flags.
inline constexpr uint32_t TYPE = 0xff; ///< the pixel type, see PIXEL_TYPES
inline constexpr uint32_t HAS_MIPMAPS = 0x100;
inline constexpr uint32_t TWIDDLED = 0x200;
inline constexpr uint32_t CUBE = 0x1000;
inline constexpr uint32_t VOLUME = 0x4000;
inline constexpr uint32_t HAS_ALPHA = 0x8000;
inline constexpr uint32_t BOTTOM_ROW_FIRST = 0x10000;

struct PixelType
{
    uint32_t code;
    Format format;
};

/// The first entry of a format is the one to write. Types below 16 are the older ones, whose 16-bit words have
/// their alpha on top. PVRTC is listed as opaque; HAS_ALPHA or an alpha mask selects the format with alpha.
inline constexpr PixelType PIXEL_TYPES[] = {
    {0x12, Format::RGBA_8888},   {0x1a, Format::BGRA_8888},   {0x05, Format::BGRA_8888},
    {0x15, Format::RGB_888},     {0x13, Format::RGB_565},     {0x02, Format::RGB_565},
    {0x10, Format::RGBA_4444},   {0x00, Format::ARGB_4444},   {0x11, Format::RGBA_5551},
    {0x01, Format::ARGB_1555},   {0x17, Format::LA_88},       {0x08, Format::LA_88},
    {0x16, Format::L_8},         {0x07, Format::L_8},         {0x1b, Format::A_8},
    {0x36, Format::ETC1},        {0x18, Format::PVRTC_2_RGB}, {0x0c, Format::PVRTC_2_RGB},
    {0x19, Format::PVRTC_4_RGB}, {0x0d, Format::PVRTC_4_RGB}};
} // namespace legacy

// --- Version 3 -----------------------------------------------------------------------------------------------

/// Word numbers.
namespace version3
{
inline constexpr unsigned VERSION = 0;
inline constexpr unsigned FLAGS = 1;
inline constexpr unsigned FORMAT = 2; ///< 64 bits, as one number in the file's byte order
inline constexpr unsigned COLOUR_SPACE = 4;
inline constexpr unsigned CHANNEL_TYPE = 5;
inline constexpr unsigned HEIGHT = 6;
inline constexpr unsigned WIDTH = 7;
inline constexpr unsigned DEPTH = 8;
inline constexpr unsigned SURFACES = 9;
inline constexpr unsigned FACES = 10;
inline constexpr unsigned LEVELS = 11; ///< counts the largest
inline constexpr unsigned METADATA_SIZE = 12;

inline constexpr uint32_t VERSION_VALUE = 0x03525650; ///< "PVR" and 3

/// Channel types whose values run from 0 to 1: bytes, shorts, integers. The format says how many bits there are.
inline constexpr uint32_t UNSIGNED_BYTE = 0;
inline constexpr uint32_t UNSIGNED_SHORT = 4;
inline constexpr uint32_t UNSIGNED_INTEGER = 8;

/// The format of named channels: a name each from the lowest byte on, and above them their numbers of bits.
/// \param bits one hexadecimal digit for each channel, the first on top
constexpr uint64_t nameChannels(const char (&names)[5], uint32_t bits)
{
    uint64_t format = 0;
    for (unsigned i = 0; i < 4; ++i)
    {
        const uint64_t count = bits >> (12 - 4 * i) & 15;
        format |= uint64_t(uint8_t(names[i])) << (8 * i) | count << (32 + 8 * i);
    }
    return format;
}

/// Indexed by Format.
inline constexpr uint64_t FORMAT_VALUES[FORMAT_COUNT] = {nameChannels("rgba", 0x8888),
                                                         nameChannels("bgra", 0x8888),
                                                         nameChannels("rgb\0", 0x8880),
                                                         nameChannels("rgb\0", 0x5650),
                                                         nameChannels("rgba", 0x4444),
                                                         nameChannels("argb", 0x4444),
                                                         nameChannels("rgba", 0x5551),
                                                         nameChannels("argb", 0x1555),
                                                         nameChannels("la\0\0", 0x8800),
                                                         nameChannels("l\0\0\0", 0x8000),
                                                         nameChannels("a\0\0\0", 0x8000),
                                                         6,
                                                         0,
                                                         1,
                                                         2,
                                                         3};
} // namespace version3

} // namespace pvr
