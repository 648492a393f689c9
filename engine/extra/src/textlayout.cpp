#include "orv/textlayout.h"

#include "placedglyphs.h"

#include "orv/detail/utf8.h"

#include "orv/assetcachepool.h"
#include "orv/log.h"
#include "orv/shaderprogramcache.h"
#include "orv/solid.h"

#include <algorithm>
#include <cmath>
#include <iterator>

namespace orv
{

namespace
{

constexpr uint32_t REPLACEMENT = 0xFFFD;

/// Invisible formatting characters: soft hyphen, joiners, direction marks, variation selectors and the like.
bool isHidden(uint32_t c)
{
    struct Range
    {
        uint32_t first, last;
    };
    constexpr Range HIDDEN[] = {{0x00AD, 0x00AD}, {0x034F, 0x034F},   {0x061C, 0x061C},   {0x115F, 0x1160},
                                {0x17B4, 0x17B5}, {0x180B, 0x180F},   {0x200B, 0x200F},   {0x202A, 0x202E},
                                {0x2060, 0x206F}, {0x3164, 0x3164},   {0xFE00, 0xFE0F},   {0xFEFF, 0xFEFF},
                                {0xFFA0, 0xFFA0}, {0x1BCA0, 0x1BCA3}, {0x1D173, 0x1D17A}, {0xE0000, 0xE0FFF}};
    const Range* range = std::lower_bound(std::begin(HIDDEN), std::end(HIDDEN), c,
                                          [](const Range& r, uint32_t code) { return r.last < code; });
    return range != std::end(HIDDEN) && c >= range->first;
}

} // namespace

TextLayout::TextLayout(AssetCachePool& pool, const GlyphCache::Ptr& glyphs, const Colour4f& colour)
    : m_glyphs(glyphs)
    , m_program(pool.getShaderProgramCache()->get("luvane#textfadequad.sp"))
    , m_colour(colour)
    , m_placed(std::make_unique<detail::PlacedGlyphs>(pool.getVertexBufferCache()))
{
    if (!glyphs)
        ORV_LOG_ERROR("A text layout has no glyph cache and will not be seen");
}

TextLayout::~TextLayout() = default;

bool TextLayout::isReady() const
{
    return m_glyphs && m_glyphs->getFontCount() > 0;
}

void TextLayout::setDensity(float pixelsPerUnit)
{
    if (!(pixelsPerUnit > 0.0f) || !std::isfinite(pixelsPerUnit))
    {
        ORV_LOG_ERROR("A text cannot have %g pixels for a unit", double(pixelsPerUnit));
        return;
    }
    m_isLaidOut = m_isLaidOut && pixelsPerUnit == m_density;
    m_density = pixelsPerUnit;
}

uint32_t TextLayout::toPixelSize(float size) const
{
    return uint32_t(std::lround(std::clamp(size * m_density, 1.0f / 64.0f, MOST_SIZE) * 64.0f));
}

float TextLayout::getPixelAscent(uint32_t size) const
{
    return std::ceil(float(m_glyphs->getFont(0)->getAscent()) * m_glyphs->getScale(0, size));
}

float TextLayout::getPixelLineHeight(uint32_t size) const
{
    const FontFace& font = *m_glyphs->getFont(0);
    return std::round(float(font.getAscent() + font.getDescent() + font.getLineGap()) *
                      m_glyphs->getScale(0, size));
}

float TextLayout::getLineHeight(float size) const
{
    return isReady() && size > 0.0f ? getPixelLineHeight(toPixelSize(size)) / m_density : 0.0f;
}

float TextLayout::getAscent(float size) const
{
    return isReady() && size > 0.0f ? getPixelAscent(toPixelSize(size)) / m_density : 0.0f;
}

/// Calls use(key, pen) for each glyph of a line, with the pen's distance from the start of the line.
/// @return the width of the line. All in pixels.
template <class Use>
float TextLayout::forEachGlyph(std::string_view line, uint32_t size, const Use& use) const
{
    float pen = 0.0f;
    GlyphCache::Key last = {GlyphCache::BOX, 0, size};
    while (!line.empty())
    {
        const int code = detail::readCodePoint(line);
        const uint32_t c = code < 0 ? REPLACEMENT : uint32_t(code);
        if (detail::isControl(int(c)) || isHidden(c))
            continue;
        const GlyphCache::Key key = m_glyphs->findCharacter(c, size);
        pen += m_glyphs->getKerning(last, key);
        use(key, pen);
        pen += m_glyphs->getAdvance(key);
        last = key;
    }
    return pen;
}

Vector2f TextLayout::measure(const char* utf8, float size) const
{
    if (!utf8 || !*utf8 || !isReady() || !(size > 0.0f))
        return {};
    const uint32_t pixelSize = toPixelSize(size);
    const FontFace& font = *m_glyphs->getFont(0);
    const float lineHeight = getPixelLineHeight(pixelSize);
    const float descent = std::ceil(float(font.getDescent()) * m_glyphs->getScale(0, pixelSize));
    Vector2f room(0.0f, getPixelAscent(pixelSize) + descent - lineHeight);
    detail::forEachLine(utf8,
                        [&](std::string_view line)
                        {
                            const float width = forEachGlyph(line, pixelSize, [](const auto&, float) {});
                            room.x = std::max(room.x, width);
                            room.y += lineHeight;
                        });
    return room / m_density;
}

bool TextLayout::takeSize(float size) const
{
    if (size > 0.0f && size * m_density <= MOST_SIZE)
        return true;
    ORV_LOG_ERROR("A text cannot have the size %g at %g pixels for a unit", double(size), double(m_density));
    return false;
}

void TextLayout::add(const char* utf8, float size, float x, float y, Alignment alignment)
{
    if (!utf8 || !takeSize(size))
        return;
    m_runs.push_back({utf8, {}, size, x, y, alignment});
    m_isLaidOut = false;
}

void TextLayout::addGlyphs(const Glyph* glyphs, std::size_t count, float size, float x, float y)
{
    if (!glyphs || !isReady() || !takeSize(size))
        return;
    Run run = {{}, {}, size, x, y, Alignment::LEFT};
    run.glyphs.reserve(count);
    std::copy_if(glyphs, glyphs + count, std::back_inserter(run.glyphs),
                 [this](const Glyph& glyph)
                 {
                     return glyph.font < m_glyphs->getFontCount() &&
                            glyph.glyph < m_glyphs->getFont(glyph.font)->getGlyphCount();
                 });
    if (run.glyphs.size() != count)
        ORV_LOG_ERROR("%u of %u glyphs are in no font", unsigned(count - run.glyphs.size()), unsigned(count));
    m_runs.push_back(std::move(run));
    m_isLaidOut = false;
}

void TextLayout::clear()
{
    m_isLaidOut = m_isLaidOut && m_runs.empty();
    m_runs.clear();
}

/// @return false if there are no fonts.
bool TextLayout::layOut()
{
    if (!isReady())
        return false;
    if (m_isLaidOut && m_fontRevision == m_glyphs->getRevision())
        return true;
    m_placed->clear();
    for (const Run& run : m_runs)
        layOutRun(run);
    m_fontRevision = m_glyphs->getRevision();
    m_isLaidOut = true;
    return true;
}

void TextLayout::layOutRun(const Run& run)
{
    const uint32_t size = toPixelSize(run.size);
    const auto put = [this](const GlyphCache::Key& key, float x, float y)
    { m_placed->add(key, std::floor(x + 0.5f), y); };

    for (const Glyph& glyph : run.glyphs)
        put({glyph.font, glyph.glyph, size}, (run.x + glyph.x) * m_density,
            std::round((run.y + glyph.y) * m_density));
    if (run.text.empty())
        return;
    float baseline = std::round(run.y * m_density) + getPixelAscent(size);
    detail::forEachLine(run.text,
                        [&](std::string_view line)
                        {
                            float start = run.x * m_density;
                            if (run.alignment != Alignment::LEFT)
                                start -= forEachGlyph(line, size, [](const auto&, float) {}) *
                                         (run.alignment == Alignment::CENTRE ? 0.5f : 1.0f);
                            forEachGlyph(line, size,
                                         [&](const GlyphCache::Key& key, float pen)
                                         { put(key, start + pen, baseline); });
                            baseline += getPixelLineHeight(size);
                        });
}

void TextLayout::draw(RenderContext& context)
{
    if (layOut())
        m_placed->draw(*m_glyphs, context, m_colour);
}

SharedPtr<Solid> TextLayout::createSolid(AssetCachePool& pool)
{
    SharedPtr<Solid> solid;
    if (layOut())
        solid = m_placed->createSolid(*m_glyphs, pool, m_program, m_colour, 1.0f / m_density);
    if (!solid)
        ORV_LOG_ERROR("A text without glyphs, or memory for them, makes no solid");
    return solid;
}

} // namespace orv
