#include "orv/glyphcache.h"

#include "fontoutlines.h"
#include "glyphatlas.h"

#include "orv/assetcachepool.h"
#include "orv/log.h"
#include "orv/shaderprogramcache.h"
#include "orv/texture2dcache.h"

#include <algorithm>
#include <cmath>

namespace orv
{

namespace
{

constexpr uint32_t CODE_POINTS = 0x110000;
constexpr std::size_t MOST_FAULTS = 16; ///< logged for one font

uint64_t pack(const GlyphCache::Key& key)
{
    return uint64_t(key.font) << 56 | uint64_t(key.glyph) << 32 | key.size;
}

float toPixels(uint32_t size)
{
    return float(size) / 64.0f;
}

} // namespace

GlyphCache::GlyphCache(AssetCachePool& pool, const GlyphCacheOptions& options)
    : m_atlas(std::make_unique<detail::GlyphAtlas>(
          pool.getTexture2DCache(), pool.getShaderProgramCache()->get("luvane#textfadequad.sp"),
          options.pageSize, options.mostPages))
    , m_picture(std::make_unique<detail::GlyphPicture>())
{
}

GlyphCache::~GlyphCache() = default;

bool GlyphCache::addFont(const FontFace::Ptr& face)
{
    if (!face || m_fonts.size() >= MOST_FONTS)
    {
        ORV_LOG_ERROR("A glyph cache takes up to %u fonts, and no empty one", MOST_FONTS);
        return false;
    }
    m_fonts.push_back(face);
    m_faulty.emplace_back();
    m_found.fill(Found());
    ++m_revision;
    return true;
}

unsigned GlyphCache::findFont(uint32_t codePoint)
{
    return searchFonts(codePoint).font;
}

unsigned GlyphCache::getGlyphCount() const
{
    return m_atlas->getGlyphCount();
}

unsigned GlyphCache::getPageCount() const
{
    return m_atlas->getPageCount();
}

uint64_t GlyphCache::getDrawnCount() const
{
    return m_atlas->getDrawnCount();
}

GlyphCache::Found GlyphCache::searchFonts(uint32_t codePoint) const
{
    Found found = {codePoint, 0, 0};
    while (found.font < m_fonts.size())
    {
        found.glyph = m_fonts[found.font]->findGlyph(codePoint);
        if (found.glyph != 0)
            break;
        ++found.font;
    }
    return found;
}

GlyphCache::Key GlyphCache::findCharacter(uint32_t codePoint, uint32_t size)
{
    Found& found = m_found[codePoint % m_found.size()];
    if (found.codePoint != codePoint)
    {
        found = searchFonts(codePoint);
        if (found.font == m_fonts.size())
        {
            reportMissing(codePoint);
            found.font = m_fonts.empty() || isBlank(0, 0) ? BOX : 0;
        }
    }
    return {found.font, found.glyph, size};
}

/// Whether a glyph has no visible pixel at a large size.
bool GlyphCache::isBlank(uint32_t font, uint32_t glyph)
{
    const float SIZE = 32.0f;
    const FontFace& face = *m_fonts[font];
    return face.getOutlines().draw(glyph, SIZE / float(face.getUnitsPerEm()), m_atlas->getPageSize() - 1,
                                   *m_picture) ||
           m_picture->width == 0;
}

void GlyphCache::reportMissing(uint32_t codePoint)
{
    if (codePoint >= CODE_POINTS)
        return;
    m_missing.resize(CODE_POINTS);
    if (!m_missing[codePoint])
        ORV_LOG_WARN("No font has the character U+%04X", unsigned(codePoint));
    m_missing[codePoint] = true;
}

/// Once for each glyph, and for a limited number: all glyphs of a font may be damaged.
void GlyphCache::reportFault(const Key& key, const char* fault)
{
    const FontFace& face = *m_fonts[key.font];
    std::vector<uint32_t>& faulty = m_faulty[key.font];
    if (faulty.size() > MOST_FAULTS || std::find(faulty.begin(), faulty.end(), key.glyph) != faulty.end())
        return;
    faulty.push_back(key.glyph);
    if (faulty.size() > MOST_FAULTS)
        ORV_LOG_WARN("Font face \"%s\": more glyphs cannot be drawn", face.getName());
    else
        ORV_LOG_WARN("Font face \"%s\", glyph %u: %s", face.getName(), unsigned(key.glyph), fault);
}

float GlyphCache::getScale(uint32_t font, uint32_t size) const
{
    const FontFace& first = *m_fonts[0];
    const float scale = toPixels(size) / float(first.getAscent() + first.getDescent());
    return scale * (float(first.getUnitsPerEm()) / float(m_fonts[font]->getUnitsPerEm()));
}

float GlyphCache::getAdvance(const Key& key) const
{
    if (key.font == BOX)
        return std::round(toPixels(key.size) * 0.6f);
    return float(m_fonts[key.font]->getAdvance(key.glyph)) * getScale(key.font, key.size);
}

float GlyphCache::getKerning(const Key& left, const Key& right) const
{
    if (left.font != right.font || left.font == BOX)
        return 0.0f;
    const int kerning = m_fonts[left.font]->getKerning(left.glyph, right.glyph);
    return kerning == 0 ? 0.0f : float(kerning) * getScale(left.font, left.size);
}

bool GlyphCache::place(const Key& key, uint32_t& number)
{
    number = m_atlas->find(pack(key));
    if (number != detail::GlyphAtlas::NONE)
        return true;
    drawGlyph(key);
    if (m_picture->width == 0)
        return true;
    number = m_atlas->add(pack(key), *m_picture);
    return number != detail::GlyphAtlas::NONE;
}

/// Draws a plain box if the glyph cannot be drawn.
void GlyphCache::drawGlyph(const Key& key)
{
    if (key.font == BOX)
        return drawBox(key.size);
    const char* fault = m_fonts[key.font]->getOutlines().draw(key.glyph, getScale(key.font, key.size),
                                                              m_atlas->getPageSize() - 1, *m_picture);
    if (!fault)
        return;
    reportFault(key, fault);
    drawBox(key.size);
}

/// Stands on the baseline, half as wide as a line is high.
void GlyphCache::drawBox(uint32_t size)
{
    const int most = m_atlas->getPageSize() - 1;
    const int width = std::clamp(int(toPixels(size) * 0.5f), 3, most);
    const int height = std::clamp(int(toPixels(size) * 0.7f), 3, most);
    const int line = std::max(1, width / 10);
    m_picture->width = width;
    m_picture->height = height;
    m_picture->x = line;
    m_picture->y = -height;
    m_picture->ink.assign(std::size_t(width) * std::size_t(height), 0);
    for (int y = 0; y < height; ++y)
    {
        for (int x = 0; x < width; ++x)
        {
            const bool isInside = x >= line && x < width - line && y >= line && y < height - line;
            m_picture->ink[std::size_t(y) * std::size_t(width) + std::size_t(x)] = isInside ? 0 : 255;
        }
    }
}

} // namespace orv
