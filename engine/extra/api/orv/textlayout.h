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

/// Any number of strings in any script that the fonts of a GlyphCache have, in one colour, drawn together: over a frame, or
/// in the scene.
///
///     const auto text = makeShared<TextLayout>(*pool, glyphs, Colour4f::WHITE);
///     text->setDensity(2.5f);                  // of the display: 2.5 of its pixels are one unit
///     text->add("Grüße, 世界", 24.0f, 10.0f, 10.0f);
///     block->render();
///     text->draw(*context);
///
/// Places and sizes are in units: x to the right, y downwards, from the upper left corner of the viewport. A unit is one
/// pixel, or as many as setDensity() says: the same numbers then give a text of the same size on every display, with glyphs
/// that were drawn for its pixels. Glyphs are put on whole pixels.
///
/// Strings are UTF-8. "\n" begins a new line. Bytes that are not UTF-8 show U+FFFD, one for each stretch that could have been
/// the beginning of a character. Control characters, and characters that are not for showing (joiners, variation
/// selectors, marks of direction), draw nothing. Each pair of glyphs of one font is kerned.
/// Characters stand one behind the other from left to right, as they come. Scripts that join or reorder their letters (Arabic,
/// Devanagari) or run from right to left are shaped by a library for that, whose glyphs addGlyphs() takes.
/// Threads: draw() and createSolid() belong to the GL thread; no locks.
class ORV_API TextLayout : public Shared
{
public:
    ORV_CLASS_NAME("TextLayout")
    using Ptr = SharedPtr<TextLayout>;

    /// Which part of each line stands at the place that was given.
    enum class Alignment : int32_t
    {
        LEFT = 0,
        CENTRE = 1,
        RIGHT = 2
    };

    /// A glyph that somebody else has placed.
    struct Glyph
    {
        unsigned font;  ///< of the cache, counted from 0
        unsigned glyph; ///< its number in the font
        float x;        ///< where the pen stands on the baseline, in units
        float y;        ///< the same, downwards
    };

    static constexpr float MOST_SIZE = 4096.0f;   ///< pixels
    static constexpr unsigned MAX_GLYPHS = 16383; ///< of one draw: four vertices each, below 65,536

    /// @param pool    borrowed during the call, for the shader program.
    /// @param glyphs  shared; with an empty one, or one without fonts, nothing is drawn.
    TextLayout(AssetCachePool& pool, const GlyphCache::Ptr& glyphs, const Colour4f& colour);
    ~TextLayout() override;

    /// Pixels for a unit, 1 at first. Strings that were added already follow. What is not above 0 is refused (logged).
    void setDensity(float pixelsPerUnit);
    float getDensity() const { return m_density; }

    // Sizes are heights of a line of the first font, from the highest ascender to the lowest descender, as Font has them.
    // Fractions of a pixel count, in 64ths.

    /// From the top of a line to the top of the next: whole pixels, in units.
    float getLineHeight(float size) const;
    /// From the top of a line to its baseline, likewise.
    float getAscent(float size) const;

    /// The room that a string takes, in units: as wide as its longest line, as high as its lines, the last without the gap
    /// below it; 0, 0 for an empty or null one. Marks and slanted letters may reach out of it, and so may the glyphs of
    /// fallback fonts.
    Vector2f measure(const char* utf8, float size) const;

    /// Adds a string. One without a size above 0, or of more than MOST_SIZE pixels, is refused (logged).
    /// @param utf8  copied; null adds nothing.
    /// @param y     top of its first line, not the baseline.
    void add(const char* utf8, float size, float x, float y, Alignment alignment = Alignment::LEFT);

    /// Adds glyphs in places of their own. Numbers of no font or glyph are left out (logged).
    /// @param glyphs  count of them, copied.
    /// @param x,y     added to each place.
    void addGlyphs(const Glyph* glyphs, std::size_t count, float size, float x, float y);

    void clear(); ///< Takes everything out again.

    /// Straight, not premultiplied; a is the opacity. Solids made before keep their colour.
    void setColour(const Colour4f& colour) { m_colour = colour; }

    const GlyphCache::Ptr& getGlyphs() const { return m_glyphs; } ///< what draws them

    /// Draws over what the viewport shows, blended, whatever the depth buffer holds; nothing is written there.
    ///
    /// One GL draw for each page of the cache that glyphs are on (and for each MAX_GLYPHS glyphs there). As long as nothing
    /// changes and nothing was forgotten, nothing is made or sent again. What all pages together cannot hold is drawn in
    /// several goes, with glyphs forgotten in between: everything is seen, but the glyphs are drawn again in each frame.
    void draw(RenderContext& context);

    /// A copy as things are, to be put into a scene.
    ///
    /// One unit is a unit, x to the right, y upwards, in the plane z = 0: what was added at (x, y) is at (x, -y). Both
    /// sides are visible; it blends and does not write depth. Glyphs of further pages are in unnamed children. Its pages
    /// keep their glyphs, and their memory, as long as it is there.
    /// @param pool  where the meshes are made, unnamed.
    /// @return empty, after an error, without any glyph, or memory.
    SharedPtr<Solid> createSolid(AssetCachePool& pool);

private:
    /// What was added.
    struct Run
    {
        std::string text;
        std::vector<Glyph> glyphs; ///< in place of a text
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
