#pragma once

#include "orv/font.h"

#include <array>
#include <cstddef>
#include <memory>

namespace orv::detail
{

/// The printable characters of one typeface at one size, drawn into one bitmap.
struct BakedFont
{
    static constexpr int WIDTH = 512; ///< pixels
    static constexpr int FIRST_CHAR = 32;
    static constexpr int CHAR_COUNT = 96;

    int height = 0;                          ///< pixels, a power of two
    std::unique_ptr<unsigned char[]> bitmap; ///< WIDTH x height coverages, top row first
    float ascent = 0.0f;                     ///< as Font has them
    float descent = 0.0f;
    float lineGap = 0.0f;
    std::array<Font::CharacterData, CHAR_COUNT> characters;
};

/// Draws a TrueType file's characters. Any file is safe: nothing outside of it is read, and memory is allocated only if
/// the characters fit.
/// @param pixelSize  from the top of a line to its bottom.
/// @param maxHeight  of the bitmap.
/// @return null, or the reason of failure; font is unchanged then.
const char* bakeFont(const unsigned char* file, std::size_t size, int pixelSize, int maxHeight,
                     BakedFont& font);

} // namespace orv::detail
