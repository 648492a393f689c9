#pragma once

#include <cstdint>

namespace pvr
{

/// Pixel formats. Names of 16-bit words run from the highest bits to the lowest, those of 8-bit channels from the first
/// byte to the last.
enum class Format : uint8_t
{
    RGBA_8888,
    BGRA_8888,
    RGB_888,
    RGB_565,
    RGBA_4444,
    ARGB_4444,
    RGBA_5551,
    ARGB_1555,
    LA_88,
    L_8,
    A_8,
    ETC1,
    PVRTC_2_RGB,
    PVRTC_2_RGBA,
    PVRTC_4_RGB,
    PVRTC_4_RGBA
};

inline constexpr unsigned FORMAT_COUNT = unsigned(Format::PVRTC_4_RGBA) + 1;

struct FormatInfo
{
    const char* name;
    unsigned bitsPerPixel;
    unsigned blockWidth, blockHeight; ///< pixels; 1 x 1 unless compressed
    unsigned blockBytes;
    unsigned leastBlocks; ///< along each side of the smallest image

    bool isCompressed() const { return blockWidth > 1; }
    bool isPvrtc() const { return leastBlocks > 1; }
};

/// Indexed by Format.
inline constexpr FormatInfo FORMATS[FORMAT_COUNT] = {{"RGBA 8888", 32, 1, 1, 4, 1},
                                                     {"BGRA 8888", 32, 1, 1, 4, 1},
                                                     {"RGB 888", 24, 1, 1, 3, 1},
                                                     {"RGB 565", 16, 1, 1, 2, 1},
                                                     {"RGBA 4444", 16, 1, 1, 2, 1},
                                                     {"ARGB 4444", 16, 1, 1, 2, 1},
                                                     {"RGBA 5551", 16, 1, 1, 2, 1},
                                                     {"ARGB 1555", 16, 1, 1, 2, 1},
                                                     {"LA 88", 16, 1, 1, 2, 1},
                                                     {"L 8", 8, 1, 1, 1, 1},
                                                     {"A 8", 8, 1, 1, 1, 1},
                                                     {"ETC1", 4, 4, 4, 8, 1},
                                                     {"PVRTC 2 bpp RGB", 2, 8, 4, 8, 2},
                                                     {"PVRTC 2 bpp RGBA", 2, 8, 4, 8, 2},
                                                     {"PVRTC 4 bpp RGB", 4, 4, 4, 8, 2},
                                                     {"PVRTC 4 bpp RGBA", 4, 4, 4, 8, 2}};

inline constexpr const FormatInfo& getInfo(Format format)
{
    return FORMATS[unsigned(format)];
}

} // namespace pvr
