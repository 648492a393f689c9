#pragma once

#include "orv/export.h"
#include "orv/fontface.h"
#include "orv/shared.h"
#include "orv/sharedptr.h"

#include <array>
#include <cstdint>
#include <memory>
#include <vector>

namespace orv
{

namespace detail
{
class GlyphAtlas;
struct GlyphPicture;
} // namespace detail

/// How much memory the glyphs of a GlyphCache may take.
struct GlyphCacheOptions
{
    /// Pixels of a side of a page, 64 to 4096, rounded down to a power of two. The largest glyph is one pixel smaller.
    unsigned pageSize = 512;
    /// 1 to 1024. A page takes its side squared in bytes, once in GL and once in memory: at most 4 MiB altogether, unless
    /// told otherwise. Pages that solids draw from are not counted.
    unsigned mostPages = 8;
};

/// Glyphs of several fonts at any size, drawn when they are first used and kept in textures; those that were used the longest
/// ago are forgotten when there is room for no more.
///
///     const auto glyphs = makeShared<GlyphCache>(*pool);
///     glyphs->addFont(FontFace::load(*pool, "DejaVuSans.ttf"));
///     glyphs->addFont(FontFace::load(*pool, "DroidSansFallbackFull.ttf")); // for what the first one does not have
///     const auto text = makeShared<TextLayout>(*pool, glyphs, Colour4f::WHITE);
///
/// A character is taken from the first font that has it. One that no font has shows the box of the first font (or a plain
/// one, where that is blank), and a warning names it, once. All fonts are drawn with the same em, that of the first one at
/// the size that a text asks for. Any number of texts share a cache.
/// A lost context takes the cache along, like everything that was made from assets: make another one for the next context.
/// The faces may be kept. Uploads of glyphs are not among FrameCounters.
/// Threads: the GL thread only.
class ORV_API GlyphCache : public Shared
{
public:
    ORV_CLASS_NAME("GlyphCache")
    using Ptr = SharedPtr<GlyphCache>;

    static constexpr unsigned MOST_FONTS = 254; ///< of one cache

    /// @param pool  borrowed during the call, for the shader program and the cache that textures are made in.
    explicit GlyphCache(AssetCachePool& pool, const GlyphCacheOptions& options = GlyphCacheOptions());
    ~GlyphCache() override;

    /// Adds a font behind those there are; texts are laid out again with it.
    /// @return false, after an error, for an empty face or one too many.
    bool addFont(const FontFace::Ptr& face);

    /// The fonts in the order in which they were added; characters are looked for in them in that order.
    unsigned getFontCount() const { return unsigned(m_fonts.size()); }
    const FontFace::Ptr& getFont(unsigned index) const
    {
        return m_fonts[index];
    } ///< index below getFontCount()

    /// The first font that has a character. @return getFontCount() if none has it.
    unsigned findFont(uint32_t codePoint);

    unsigned getGlyphCount() const; ///< that are kept now
    unsigned getPageCount() const;  ///< that they are on
    uint64_t getDrawnCount() const; ///< of glyphs that were drawn since the start, forgotten ones again

    // What follows is for TextLayout.

    /// A glyph at a size. The size is that of a line of the first font, in 64ths of a pixel.
    struct Key
    {
        uint32_t font;  ///< of the cache, counted from 0, or BOX
        uint32_t glyph; ///< its number in the font
        uint32_t size;  ///< 64ths of a pixel
    };
    static constexpr uint32_t BOX = 255; ///< the font of the plain box

    /// The glyph of a character, or of the box.
    Key findCharacter(uint32_t codePoint, uint32_t size);
    float getAdvance(const Key& key) const;                    ///< pixels
    float getKerning(const Key& left, const Key& right) const; ///< pixels; 0 across fonts
    /// Pixels for a unit of a font. @param font  below getFontCount().
    float getScale(uint32_t font, uint32_t size) const;

    /// Has a glyph drawn if it is not there, and uses it.
    /// @param number  set to its place in the atlas, or to GlyphAtlas::NONE for what is blank.
    /// @return false if there is no room, everything being in use.
    bool place(const Key& key, uint32_t& number);

    detail::GlyphAtlas& getAtlas() { return *m_atlas; } ///< where glyphs are drawn
    uint32_t getRevision() const { return m_revision; } ///< changes with the fonts

private:
    struct Found
    {
        uint32_t codePoint = UINT32_MAX;
        uint32_t font = 0;
        uint32_t glyph = 0;
    };

    ORV_LOCAL Found searchFonts(uint32_t codePoint) const;
    ORV_LOCAL bool isBlank(uint32_t font, uint32_t glyph);
    ORV_LOCAL void drawGlyph(const Key& key);
    ORV_LOCAL void drawBox(uint32_t size);
    ORV_LOCAL void reportMissing(uint32_t codePoint);
    ORV_LOCAL void reportFault(const Key& key, const char* fault);

    std::vector<FontFace::Ptr> m_fonts;
    std::unique_ptr<detail::GlyphAtlas> m_atlas;
    std::unique_ptr<detail::GlyphPicture> m_picture; ///< the last that was drawn
    std::array<Found, 1024> m_found;                 ///< by the last bits of the character
    std::vector<bool> m_missing;                     ///< characters that a warning has named
    std::vector<std::vector<uint32_t>> m_faulty;     ///< glyphs of each font that a warning has named
    uint32_t m_revision = 0;
};

} // namespace orv
