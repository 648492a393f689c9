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
    /// 1 to 1024. A page takes its side squared in bytes, once in GL and once in memory: by default at most 4 MiB in
    /// all. Pages used by solids are not counted.
    unsigned mostPages = 8;
};

/// Glyphs of several fonts at any size, drawn when they are first used and kept in textures. When these are full, the
/// least recently used glyphs are dropped.
///
///     const auto glyphs = makeShared<GlyphCache>(*pool);
///     glyphs->addFont(FontFace::load(*pool, "DejaVuSans.ttf"));
///     glyphs->addFont(FontFace::load(*pool, "DroidSansFallbackFull.ttf")); // for characters that the first one lacks
///     const auto text = makeShared<TextLayout>(*pool, glyphs, Colour4f::WHITE);
///
/// A character comes from the first font that has it. If no font has it, the box of the first font is shown (or a plain
/// box, if that is blank), and one warning names the character. All fonts are scaled to the first one's em at the
/// text's size. Any number of texts share a cache. After a lost context, make a new cache; faces may be kept.
/// FrameCounters do not count uploads of glyphs. Threads: the GL thread only.
class ORV_API GlyphCache : public Shared
{
public:
    ORV_CLASS_NAME("GlyphCache")
    using Ptr = SharedPtr<GlyphCache>;

    static constexpr unsigned MOST_FONTS = 254; ///< of one cache

    /// @param pool  borrowed during the call, for the shader program and the cache that textures are made in.
    explicit GlyphCache(AssetCachePool& pool, const GlyphCacheOptions& options = GlyphCacheOptions());
    ~GlyphCache() override;

    /// Adds a font as the last one; texts are laid out again.
    /// @return false, after an error, for an empty face or one too many.
    bool addFont(const FontFace::Ptr& face);

    /// The fonts in the order in which they were added and are searched.
    unsigned getFontCount() const { return unsigned(m_fonts.size()); }
    const FontFace::Ptr& getFont(unsigned index) const
    {
        return m_fonts[index];
    } ///< index below getFontCount()

    /// The first font that has a character. @return getFontCount() if none has it.
    unsigned findFont(uint32_t codePoint);

    unsigned getGlyphCount() const; ///< now in the cache
    unsigned getPageCount() const;  ///< that they are on
    uint64_t getDrawnCount() const; ///< of glyphs drawn so far, each drawing counted

    // For TextLayout.

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

    /// Draws a glyph if it is not in the cache, and marks it as used.
    /// @param number  set to its number in the atlas, or to GlyphAtlas::NONE for a blank glyph.
    /// @return false if everything in the cache is in use.
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
    std::unique_ptr<detail::GlyphPicture> m_picture; ///< the last one drawn
    std::array<Found, 1024> m_found;                 ///< by the last bits of the character
    std::vector<bool> m_missing;                     ///< characters that a warning has named
    std::vector<std::vector<uint32_t>> m_faulty;     ///< glyphs of each font that a warning has named
    uint32_t m_revision = 0;
};

} // namespace orv
