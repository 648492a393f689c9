#include "fontoutlines.h"

#include "glyphprogram.h"

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
constexpr float FLATNESS = 0.35f;      ///< the most pixels between a curve and its edges

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
    float getWidth() const { return float(x1 - x0); }
    float getHeight() const { return float(y1 - y0); }
    float getSides() const { return getWidth() + getHeight(); }
};

/// The outline of a glyph.
struct Shape
{
    Box box;
    std::vector<stbtt_vertex> points; ///< empty for a blank
};

/// The most edges that the rasteriser makes of a curve.
float countEdges(const stbtt_vertex& from, const stbtt_vertex& to, float scale)
{
    const float ROUNDING = 1024.0f;
    const auto measure = [scale](int x, int y) { return std::hypot(float(x), float(y)) * scale / FLATNESS; };
    if (to.type == STBTT_vcurve)
        return 1.0f + 2.0f * std::sqrt(0.25f * measure(from.x - 2 * to.cx + to.x, from.y - 2 * to.cy + to.y));
    if (to.type != STBTT_vcubic)
        return 1.0f;
    // Each halving leaves a quarter of the bend. The rasteriser stops when the squared lengths of the control polygon and of
    // the chord are close. They differ by at most 6 squares of the bend, and by rounding.
    const float bend = std::max(measure(from.x - 2 * to.cx + to.cx1, from.y - 2 * to.cy + to.cy1),
                                measure(to.cx - 2 * to.cx1 + to.x, to.cy - 2 * to.cy1 + to.y));
    const float way = measure(to.cx - from.x, to.cy - from.y) + measure(to.cx1 - to.cx, to.cy1 - to.cy) +
                      measure(to.x - to.cx1, to.y - to.cy1);
    const float edges = std::max({1.0f, std::sqrt(std::sqrt(12.0f) * bend), way / ROUNDING});
    return std::exp2(std::ceil(std::log2(edges)));
}

/// Checks the cost of drawing a shape. Sorting its edges is quadratic in the worst case. Each edge takes a step for
/// each pixel along it or, outside the glyph's box, for each pixel of the rows that it crosses.
/// @return null, or why it must not be drawn.
const char* findCostFault(const Shape& shape, float scale)
{
    const float MOST_EDGES = 8192.0f;
    const float FEW_STEPS = 100000.0f; // allowed for any glyph
    const float STEPS_PER_PIXEL = 16.0f;

    const Box& box = shape.box;
    const float margin = std::max(box.getWidth(), box.getHeight());
    float edges = 0.0f;
    float steps = 0.0f;
    for (std::size_t i = 0; i < shape.points.size(); ++i)
    {
        const stbtt_vertex& to = shape.points[i];
        const stbtt_vertex& from = shape.points[i == 0 ? 0 : i - 1];
        Box reach = {to.x, to.y, to.x, to.y};
        reach.add(from.x, from.y);
        if (to.type == STBTT_vcurve || to.type == STBTT_vcubic)
            reach.add(to.cx, to.cy);
        if (to.type == STBTT_vcubic)
            reach.add(to.cx1, to.cy1);
        edges += countEdges(from, to, scale);
        Box both = box;
        both.add(reach.x0, reach.y0);
        both.add(reach.x1, reach.y1);
        const bool isInside = both.getSides() <= box.getSides();
        if (both.getSides() > box.getSides() + 4.0f * margin)
            return "it reaches far out of its box";
        const float rows = reach.getHeight() * scale + 1.0f;
        steps += isInside ? rows + reach.getWidth() * scale : rows * (box.getWidth() * scale + 1.0f);
    }
    const float pixels = (box.getWidth() * scale + 1.0f) * (box.getHeight() * scale + 1.0f);
    return edges > MOST_EDGES || steps > FEW_STEPS + STEPS_PER_PIXEL * pixels
               ? "its outline is too complicated"
               : nullptr;
}

/// Reads a TrueType outline. @return null, or why there is none.
const char* readShape(const stbtt_fontinfo& info, FontTables tables, uint32_t glyph, Shape& shape)
{
    if (const char* fault = tables.findGlyphFault(glyph))
        return fault;
    Box& box = shape.box;
    if (!stbtt_GetGlyphBox(&info, int(glyph), &box.x0, &box.y0, &box.x1, &box.y1))
        return nullptr;
    stbtt_vertex* points = nullptr;
    const int count = stbtt_GetGlyphShape(&info, int(glyph), &points);
    shape.points.assign(points, points + std::max(0, count));
    stbtt_FreeShape(&info, points);
    return nullptr;
}

/// Reads a PostScript outline; its box is that of all points, control points included.
const char* readShape(const CffTable& outlines, FontTables tables, uint32_t glyph, Shape& shape)
{
    if (!tables.hasMetrics(glyph))
        return "widths are missing";
    std::vector<OutlineStep> steps;
    if (const char* fault = GlyphProgram().run(outlines.getProgram(glyph), steps))
        return fault;
    shape.points.reserve(steps.size());
    for (const OutlineStep& step : steps)
    {
        const bool isCurve = step.kind == OutlineStep::Kind::CURVE;
        if (shape.points.empty())
            shape.box = {step.x, step.y, step.x, step.y};
        shape.box.add(step.x, step.y);
        if (isCurve)
        {
            shape.box.add(step.x1, step.y1);
            shape.box.add(step.x2, step.y2);
        }
        const int type = isCurve                                ? STBTT_vcubic
                         : step.kind == OutlineStep::Kind::LINE ? STBTT_vline
                                                                : STBTT_vmove;
        shape.points.push_back(
            {step.x, step.y, step.x1, step.y1, step.x2, step.y2, static_cast<unsigned char>(type), 0});
    }
    return nullptr;
}

} // namespace

struct FontOutlines::Rasteriser
{
    FontTables tables;
    bool isPostScript = false;
    stbtt_fontinfo info = {}; ///< for TrueType outlines only: the rasteriser reads no others by itself
    CffTable outlines = {};

    const char* read(uint32_t glyph, Shape& shape) const
    {
        return isPostScript ? readShape(outlines, tables, glyph, shape)
                            : readShape(info, tables, glyph, shape);
    }
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

FontOutlines::FontOutlines(const FontTables& tables, const CffTable& outlines)
    : m_rasteriser(new Rasteriser{tables, true, {}, outlines})
{
}

FontOutlines::~FontOutlines() = default;

const char* FontOutlines::draw(uint32_t glyph, float scale, int mostSide, GlyphPicture& picture) const
{
    picture.width = picture.height = 0;
    Shape shape;
    if (const char* fault = m_rasteriser->read(glyph, shape))
        return fault;
    if (shape.points.empty())
        return nullptr;
    const Box& box = shape.box;
    Box reach = box;
    reach.add(0, 0);
    const auto most = float(mostSide);
    if (reach.getSides() * scale > MOST_REACH || box.getWidth() * scale > most ||
        box.getHeight() * scale > most)
        return "it is too large at this size";
    const int left = int(std::floor(float(box.x0) * scale));
    const int top = int(std::floor(float(-box.y1) * scale));
    const int width = int(std::ceil(float(box.x1) * scale)) - left;
    const int height = int(std::ceil(float(-box.y0) * scale)) - top;
    if (width > mostSide || height > mostSide)
        return "it is too large at this size";
    if (width <= 0 || height <= 0)
        return nullptr;
    if (const char* fault = findCostFault(shape, scale))
        return fault;

    picture.width = width;
    picture.height = height;
    picture.x = left;
    picture.y = top;
    picture.ink.assign(std::size_t(width) * std::size_t(height), 0);
    stbtt__bitmap bitmap = {width, height, width, picture.ink.data()};
    stbtt_Rasterize(&bitmap, FLATNESS, shape.points.data(), int(shape.points.size()), scale, scale, 0.0f,
                    0.0f, left, top, 1, nullptr);
    return nullptr;
}

} // namespace orv::detail
