#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <vector>

namespace orv::detail
{

class CffTable;
class FontTables;

/// A glyph at one size, drawn.
struct GlyphPicture
{
    int width = 0; ///< pixels; 0 for a blank
    int height = 0;
    int x = 0; ///< of the upper left corner, relative to the pen on the baseline; y downwards
    int y = 0;
    std::vector<unsigned char> ink; ///< width x height, top row first: 255 is full
};

/// Draws the glyphs of a font whose tables have been checked; each glyph is checked when it is drawn.
///
/// The time for a glyph is limited by its number of pixels.
class FontOutlines
{
public:
    /// TrueType outlines.
    /// @param file    borrowed as long as this object exists; not written to.
    /// @param tables  of this file, without a fault; copied.
    FontOutlines(unsigned char* file, const FontTables& tables);

    /// PostScript outlines.
    /// @param outlines  of the same file, which must outlive this object; copied.
    FontOutlines(const FontTables& tables, const CffTable& outlines);
    ~FontOutlines();

    /// @param scale    pixels for a unit of the font.
    /// @param mostSide  limit of width and height, pixels.
    /// @param picture   filled; its memory is reused.
    /// @return null, or why the glyph cannot be drawn.
    const char* draw(uint32_t glyph, float scale, int mostSide, GlyphPicture& picture) const;

private:
    struct Rasteriser;
    std::unique_ptr<Rasteriser> m_rasteriser;
};

} // namespace orv::detail
