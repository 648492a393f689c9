#include "fontoutlines.h"

#include "orv/detail/fonttables.h"

// As in the engine's own baker: all static, and assertions must not stop the program; their conditions on the file are
// checked before.
#define STB_TRUETYPE_IMPLEMENTATION
#define STBTT_STATIC
#define STBTT_assert(condition) ((void)0)
#pragma GCC diagnostic push
#pragma GCC diagnostic ignored "-Wunused-function"
#include <stb/stb_truetype.h>
#pragma GCC diagnostic pop

#include <algorithm>
#include <cmath>

namespace orv::detail
{

namespace
{

constexpr float MOST_REACH = 16384.0f; ///< pixels from the pen; the rasteriser keeps positions in 16 bits

/// A rectangle in the font's own units.
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
    float getSides() const { return float(x1 - x0) + float(y1 - y0); }
};

/// Checks the cost of drawing a shape. Sorting its edges is quadratic in the worst case. Each edge takes a step for
/// each pixel along it or, outside the glyph's box, for each pixel of the rows that it crosses.
/// @return null, or why it must not be drawn.
const char* findCostFault(const stbtt_vertex* points, int count, const Box& box, float scale)
{
    const float FLATNESS = 0.35f; // pixels by which the edges may miss the curve
    const float MOST_EDGES = 8192.0f;
    const float FEW_STEPS = 100000.0f; // allowed for any glyph
    const float STEPS_PER_PIXEL = 16.0f;

    const float width = float(box.x1 - box.x0);
    const float height = float(box.y1 - box.y0);
    const float margin = std::max(width, height);
    float edges = 0.0f;
    float steps = 0.0f;
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
            const auto dx = float(from.x + to.x - 2 * to.cx);
            const auto dy = float(from.y + to.y - 2 * to.cy);
            edges += 2.0f * std::sqrt(std::hypot(dx, dy) * 0.25f * scale / FLATNESS);
        }
        Box both = box;
        both.add(reach.x0, reach.y0);
        both.add(reach.x1, reach.y1);
        const bool isInside = both.getSides() <= box.getSides();
        if (both.getSides() > box.getSides() + 4.0f * margin)
            return "it reaches far out of its box";
        const float rows = float(reach.y1 - reach.y0) * scale + 1.0f;
        steps += isInside ? rows + float(reach.x1 - reach.x0) * scale : rows * (width * scale + 1.0f);
    }
    const float pixels = (width * scale + 1.0f) * (height * scale + 1.0f);
    return edges > MOST_EDGES || steps > FEW_STEPS + STEPS_PER_PIXEL * pixels
               ? "its outline is too complicated"
               : nullptr;
}

} // namespace

struct FontOutlines::Rasteriser
{
    FontTables tables;
    stbtt_fontinfo info = {};
};

/// Fills the rasteriser's record directly: its own function reads further, unchecked tables.
FontOutlines::FontOutlines(unsigned char* file, const FontTables& tables)
    : m_rasteriser(new Rasteriser{tables})
{
    stbtt_fontinfo& info = m_rasteriser->info;
    info.data = file;
    const auto locate = [&tables](uint32_t tag)
    {
        FontTables all = tables;
        FontBytes table;
        all.findTable(tag, table);
        return table;
    };
    FontBytes head = locate(makeFontTag("head"));
    info.head = int(head.start() - file);
    info.loca = int(locate(makeFontTag("loca")).start() - file);
    info.glyf = int(locate(makeFontTag("glyf")).start() - file);
    info.indexToLocFormat = int(head.u16(50));
    info.numGlyphs = int(tables.getGlyphCount());
}

FontOutlines::~FontOutlines() = default;

const char* FontOutlines::draw(uint32_t glyph, float scale, int mostSide, GlyphPicture& picture) const
{
    picture.width = picture.height = 0;
    FontTables tables = m_rasteriser->tables; // a copy: a fault in one glyph must not affect others
    if (const char* fault = tables.findGlyphFault(glyph))
        return fault;
    const stbtt_fontinfo& info = m_rasteriser->info;
    Box box;
    if (!stbtt_GetGlyphBox(&info, int(glyph), &box.x0, &box.y0, &box.x1, &box.y1))
        return nullptr; // a blank glyph
    Box reach = box;
    reach.add(0, 0);
    if (reach.getSides() * scale > MOST_REACH || float(box.x1 - box.x0) * scale > float(mostSide) ||
        float(box.y1 - box.y0) * scale > float(mostSide))
        return "it is too large at this size";
    Box pixels;
    stbtt_GetGlyphBitmapBox(&info, int(glyph), scale, scale, &pixels.x0, &pixels.y0, &pixels.x1, &pixels.y1);
    const int width = pixels.x1 - pixels.x0;
    const int height = pixels.y1 - pixels.y0;
    if (width > mostSide || height > mostSide)
        return "it is too large at this size";
    if (width <= 0 || height <= 0)
        return nullptr;

    stbtt_vertex* points = nullptr;
    const int count = stbtt_GetGlyphShape(&info, int(glyph), &points);
    const char* fault = findCostFault(points, count, box, scale);
    if (!fault && count > 0)
    {
        picture.width = width;
        picture.height = height;
        picture.x = pixels.x0;
        picture.y = pixels.y0;
        picture.ink.assign(std::size_t(width) * std::size_t(height), 0);
        stbtt__bitmap bitmap = {width, height, width, picture.ink.data()};
        stbtt_Rasterize(&bitmap, 0.35f, points, count, scale, scale, 0.0f, 0.0f, pixels.x0, pixels.y0, 1,
                        info.userdata);
    }
    stbtt_FreeShape(&info, points);
    return fault;
}

} // namespace orv::detail
