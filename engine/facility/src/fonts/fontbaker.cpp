#include "fontbaker.h"

#include "orv/detail/fonttables.h"

// The only source that implements stb_truetype, all static. Its assertions must not stop the program; their conditions
// on the file are checked before.
#define STB_TRUETYPE_IMPLEMENTATION
#define STBTT_STATIC
#define STBTT_assert(condition) ((void)0)
#pragma GCC diagnostic push
#pragma GCC diagnostic ignored "-Wunused-function"
#include <stb/stb_truetype.h>
#pragma GCC diagnostic pop

#include <algorithm>
#include <cmath>
#include <new>

namespace orv::detail
{

namespace
{

const int MAX_SIZE = 8192; ///< pixels, far above what fits the atlas
const int MAX_GLYPH_WIDTH = BakedFont::WIDTH - 2;
const int MAX_HEIGHT = 16384; ///< the rasteriser keeps positions in 16 bits

/// Where glyphs go: from left to right, row below row.
class Packing
{
public:
    explicit Packing(int gap) : m_gap(gap) {}

    void add(int width, int height)
    {
        if (m_x + width + 1 >= BakedFont::WIDTH)
        {
            m_x = 1;
            m_y = m_bottom;
        }
        m_bottom = std::max(m_bottom, m_y + height + m_gap);
        m_x += width + m_gap;
    }
    int getBottom() const { return m_bottom; }

private:
    int m_gap;
    int m_x = 1;
    int m_y = 1;
    int m_bottom = 1;
};

/// A glyph's rectangle in the font's own units.
struct Box
{
    int x0 = 0, y0 = 0, x1 = 0, y1 = 0;

    void add(int x, int y)
    {
        x0 = std::min(x0, x);
        y0 = std::min(y0, y);
        x1 = std::max(x1, x);
        y1 = std::max(y1, y);
    }
    int getWidth() const { return x1 - x0; }
    int getHeight() const { return y1 - y0; }
    bool contains(const Box& box) const
    {
        return box.x0 >= x0 && box.y0 >= y0 && box.x1 <= x1 && box.y1 <= y1;
    }
};

/// The cost of drawing outlines, summed over glyphs.
class Cost
{
public:
    explicit Cost(std::size_t fileSize) : m_mostSteps(FEW_STEPS + STEPS_PER_BYTE * float(fileSize)) {}

    /// @return null, or why the glyph must not be drawn.
    const char* add(const stbtt_fontinfo& font, int glyph, const Box& box, float scale)
    {
        stbtt_vertex* points = nullptr;
        const int count = stbtt_GetGlyphShape(&font, glyph, &points);
        const int margin = std::max(box.getWidth(), box.getHeight());
        const Box limits = {box.x0 - margin, box.y0 - margin, box.x1 + margin, box.y1 + margin};
        float edges = 0.0f;
        bool isNear = true;
        for (int i = 0; i < count; ++i)
        {
            const stbtt_vertex& to = points[i];
            const stbtt_vertex& from = points[std::max(0, i - 1)];
            Box reach = {to.x, to.y, to.x, to.y};
            reach.add(from.x, from.y);
            edges += 1.0f;
            if (to.type == STBTT_vcurve)
            {
                reach.add(to.cx, to.cy);
                edges += countHalves(from, to, scale);
            }
            isNear = isNear && limits.contains(reach);
            // A step for each pixel along an edge; outside the box, for each pixel of a row.
            const float rows = float(reach.getHeight()) * scale + 1.0f;
            m_steps += box.contains(reach) ? rows + float(reach.getWidth()) * scale
                                           : rows * (float(box.getWidth()) * scale + 1.0f);
        }
        stbtt_FreeShape(&font, points);
        m_edges += edges;
        if (!isNear)
            return "a glyph reaches far out of its box";
        return edges > MAX_EDGES || m_edges > MAX_ALL_EDGES || m_steps > std::min(m_mostSteps, MAX_STEPS)
                   ? "its outlines are too complicated"
                   : nullptr;
    }

private:
    static constexpr float FLATNESS = 0.35f;     ///< pixels by which the edges may miss the curve
    static constexpr float MAX_EDGES = 16384.0f; ///< of one glyph; the sorting is quadratic at its worst
    static constexpr float MAX_ALL_EDGES = 262144.0f;
    static constexpr float MAX_STEPS = 5.0e7f;
    static constexpr float FEW_STEPS = 1.0e7f; ///< that any file may take
    static constexpr float STEPS_PER_BYTE = 100.0f;

    /// A curve is halved, which quarters its distance from the straight line, until that is below FLATNESS.
    static float countHalves(const stbtt_vertex& from, const stbtt_vertex& to, float scale)
    {
        const float dx = float(from.x + to.x - 2 * to.cx);
        const float dy = float(from.y + to.y - 2 * to.cy);
        return 2.0f * std::sqrt(std::hypot(dx, dy) * 0.25f * scale / FLATNESS);
    }

    const float m_mostSteps;
    float m_edges = 0.0f;
    float m_steps = 0.0f;
};

/// Finds the bitmap's height by packing all glyphs, and checks their cost.
/// @return null, or why not.
const char* findHeight(const stbtt_fontinfo& font, std::size_t fileSize, float scale, int maxHeight,
                       int& height)
{
    Packing described(2);
    Packing rasterisers(1); // packs closer, which can make rows higher
    Cost cost(fileSize);
    int needed = 0;
    for (int i = 0; i < BakedFont::CHAR_COUNT; ++i)
    {
        const int glyph = stbtt_FindGlyphIndex(&font, BakedFont::FIRST_CHAR + i);
        Box box;
        stbtt_GetGlyphBox(&font, glyph, &box.x0, &box.y0, &box.x1, &box.y1);
        Box reach = box;
        reach.add(0, 0);
        if (float(std::max(reach.getWidth(), reach.getHeight())) * scale > float(MAX_HEIGHT))
            return "a glyph is too large at this size";
        if (const char* fault = cost.add(font, glyph, box, scale))
            return fault;

        stbtt_GetGlyphBitmapBox(&font, glyph, scale, scale, &box.x0, &box.y0, &box.x1, &box.y1);
        if (box.getWidth() > MAX_GLYPH_WIDTH)
            return "a glyph is wider than 510 pixels at this size";
        described.add(box.getWidth(), box.getHeight());
        rasterisers.add(box.getWidth(), box.getHeight());
        needed = std::max(described.getBottom(), rasterisers.getBottom() + 1);
        if (needed > maxHeight)
            return "the atlas is higher than the largest texture at this size";
    }
    height = 1;
    while (height < needed)
        height *= 2;
    return height <= maxHeight ? nullptr : "the atlas is higher than the largest texture at this size";
}

} // namespace

const char* bakeFont(const unsigned char* file, std::size_t size, int pixelSize, int maxHeight,
                     BakedFont& font)
{
    if (pixelSize < 1 || pixelSize > MAX_SIZE)
        return "the size is not between 1 and 8192 pixels";
    if (const char* fault = findFontFault(file, size, BakedFont::FIRST_CHAR, BakedFont::CHAR_COUNT))
        return fault;
    stbtt_fontinfo info = {};
    if (!stbtt_InitFont(&info, file, 0))
        return "it is no TrueType font";

    const float scale = stbtt_ScaleForPixelHeight(&info, float(pixelSize));
    int height = 0;
    if (const char* reason = findHeight(info, size, scale, std::min(maxHeight, MAX_HEIGHT), height))
        return reason;
    std::unique_ptr<unsigned char[]> bitmap(
        new (std::nothrow) unsigned char[std::size_t(BakedFont::WIDTH) * std::size_t(height)]());
    if (!bitmap)
        return "there is no memory for the atlas";
    std::array<stbtt_bakedchar, BakedFont::CHAR_COUNT> baked = {};
    if (stbtt_BakeFontBitmap(file, 0, float(pixelSize), bitmap.get(), BakedFont::WIDTH, height,
                             BakedFont::FIRST_CHAR, BakedFont::CHAR_COUNT, baked.data()) <= 0)
        return "the atlas does not take all glyphs";

    int ascent = 0, descent = 0, lineGap = 0;
    stbtt_GetFontVMetrics(&info, &ascent, &descent, &lineGap);
    font.height = height;
    font.bitmap = std::move(bitmap);
    font.ascent = float(ascent) * scale;
    font.descent = -(float(descent) * scale);
    font.lineGap = float(lineGap) * scale;
    std::transform(baked.begin(), baked.end(), font.characters.begin(),
                   [](const stbtt_bakedchar& c)
                   {
                       return Font::CharacterData{float(c.x0), float(c.y0), float(c.x1), float(c.y1),
                                                  c.xoff,      c.yoff,      c.xadvance};
                   });
    return nullptr;
}

} // namespace orv::detail
