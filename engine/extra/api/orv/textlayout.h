#pragma once

#include "orv/colour.h"
#include "orv/export.h"
#include "orv/glyphcache.h"
#include "orv/shared.h"
#include "orv/sharedptr.h"
#include "orv/vector.h"

#include <cstddef>
#include <cstdint>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

namespace orv
{

class AssetCachePool;
class RenderContext;
class ShaderProgram;
class Solid;

namespace detail
{
class PlacedGlyphs;
}

/// Any number of strings in one colour, in any script of a GlyphCache's fonts, drawn together over a frame or in the
/// scene.
///
///     const auto text = makeShared<TextLayout>(*pool, glyphs, Colour4f::WHITE);
///     text->setDensity(2.5f);                  // of the display: 2.5 of its pixels are one unit
///     text->add("Grüße, 世界", 24.0f, 10.0f, 10.0f);
///     block->render();
///     text->draw(*context);
///
/// Positions and sizes are in units: x to the right, y downwards, from the upper left corner of the viewport.
/// setDensity() sets the pixels per unit (at first 1): the same numbers then give the same size on every display, with
/// glyphs drawn for its pixels. Glyphs are placed on whole pixels.
///
/// Strings are UTF-8. "\n" begins a new line. Invalid bytes show U+FFFD, one for each sequence that could begin a
/// character. Control characters and invisible ones (joiners, variation selectors, direction marks) draw nothing. Each
/// pair of glyphs of one font is kerned. Characters are placed from left to right in the string's order. Scripts that
/// join or reorder letters (Arabic, Devanagari) or run from right to left need a shaping library; pass its glyphs to
/// addGlyphs(). Threads: draw() and createSolid() belong to the GL thread; no locks.
class ORV_API TextLayout : public Shared
{
public:
    ORV_CLASS_NAME("TextLayout")
    using Ptr = SharedPtr<TextLayout>;

    /// Which part of each line is at the given position.
    enum class Alignment : int32_t
    {
        LEFT = 0,
        CENTRE = 1,
        RIGHT = 2
    };

    /// A glyph placed by the caller.
    struct Glyph
    {
        unsigned font;  ///< of the cache, counted from 0
        unsigned glyph; ///< its number in the font
        float x;        ///< of the pen on the baseline, in units
        float y;        ///< the same, downwards
    };

    static constexpr float MOST_SIZE = 4096.0f;   ///< pixels
    static constexpr unsigned MAX_GLYPHS = 16383; ///< of one draw: four vertices each, below 65,536

    /// @param pool    borrowed during the call, for the shader program.
    /// @param glyphs  shared; with an empty one, or one without fonts, nothing is drawn.
    TextLayout(AssetCachePool& pool, const GlyphCache::Ptr& glyphs, const Colour4f& colour);
    ~TextLayout() override;

    /// Pixels for a unit, 1 at first. Strings already added are laid out again. Values not above 0 are refused
    /// (logged).
    void setDensity(float pixelsPerUnit);
    float getDensity() const { return m_density; }

    // Sizes are heights of a line of the first font, from the highest ascender to the lowest descender, as Font has them.
    // Fractions of a pixel count, in 64ths.

    /// From the top of a line to the top of the next: whole pixels, in units.
    float getLineHeight(float size) const;
    /// From the top of a line to its baseline, likewise.
    float getAscent(float size) const;

    /// The size of a string in units: the width of its longest line and the height of its lines, without the gap below
    /// the last; 0, 0 for an empty or null one. Marks, slanted letters and glyphs of fallback fonts may extend beyond
    /// it.
    Vector2f measure(const char* utf8, float size) const;

    /// Adds a string. One without a size above 0, or of more than MOST_SIZE pixels, is refused (logged).
    /// @param utf8  copied; null adds nothing.
    /// @param y     top of its first line, not the baseline.
    void add(const char* utf8, float size, float x, float y, Alignment alignment = Alignment::LEFT);

    /// Adds glyphs at given positions. Invalid fonts or glyph numbers are left out (logged).
    /// @param glyphs  count of them, copied.
    /// @param x,y     added to each position.
    void addGlyphs(const Glyph* glyphs, std::size_t count, float size, float x, float y);

    void clear(); ///< Removes everything.

    /// Straight, not premultiplied; a is the opacity. Existing solids keep their colour.
    void setColour(const Colour4f& colour) { m_colour = colour; }

    const GlyphCache::Ptr& getGlyphs() const { return m_glyphs; } ///< the glyphs' cache

    /// Draws over the viewport, blended; depth is neither tested nor written.
    ///
    /// One GL draw for each page of the cache that glyphs are on (and for each MAX_GLYPHS glyphs there). An unchanged
    /// text whose glyphs are still cached needs no layout or upload. A text that needs more glyphs than all pages hold
    /// is drawn in several passes: it is complete, but its glyphs are drawn again in each frame.
    void draw(RenderContext& context);

    /// A copy of the current text for a scene.
    ///
    /// In the plane z = 0, x to the right, y upwards, in the same units: a string added at (x, y) is at (x, -y). Both
    /// sides are visible; it blends and does not write depth. Glyphs of further pages are in unnamed children. Its
    /// pages, with their glyphs and memory, are kept as long as it exists.
    /// @param pool  in which the unnamed meshes are made.
    /// @return empty, after an error, without glyphs or memory.
    SharedPtr<Solid> createSolid(AssetCachePool& pool);

private:
    /// What was added.
    struct Run
    {
        std::string text;
        std::vector<Glyph> glyphs; ///< instead of a text
        float size, x, y;
        Alignment alignment;
    };

    ORV_LOCAL bool isReady() const;
    ORV_LOCAL bool takeSize(float size) const;
    ORV_LOCAL uint32_t toPixelSize(float size) const;
    ORV_LOCAL bool layOut();
    ORV_LOCAL void layOutRun(const Run& run);
    template <class Use>
    ORV_LOCAL float forEachGlyph(std::string_view line, uint32_t size, const Use& use) const;
    ORV_LOCAL float getPixelAscent(uint32_t size) const;
    ORV_LOCAL float getPixelLineHeight(uint32_t size) const;

    GlyphCache::Ptr m_glyphs;
    SharedPtr<ShaderProgram> m_program;
    Colour4f m_colour;
    float m_density = 1.0f;
    std::vector<Run> m_runs;
    std::unique_ptr<detail::PlacedGlyphs> m_placed; ///< m_runs, laid out
    uint32_t m_fontRevision = 0;                    ///< of the fonts that they were laid out with
    bool m_isLaidOut = true;
};

} // namespace orv
