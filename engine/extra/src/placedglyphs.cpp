#include "placedglyphs.h"

#include "glyphquads.h"

#include "orv/appearance.h"
#include "orv/assetcachepool.h"
#include "orv/mesh.h"
#include "orv/rendercontext.h"
#include "orv/solid.h"
#include "orv/textlayout.h"
#include "orv/texture2d.h"
#include "orv/vertexbuffercache.h"

#include <algorithm>

namespace orv::detail
{

namespace
{

constexpr std::size_t FEWEST_QUADS = 32; ///< capacity of a buffer

bool isSame(const Colour4f& a, const Colour4f& b)
{
    return a.r == b.r && a.g == b.g && a.b == b.b && a.a == b.a;
}

/// Capacity with a reserve, so that changing texts seldom need a new buffer.
unsigned findRoom(std::size_t count)
{
    std::size_t room = FEWEST_QUADS;
    while (room < count)
        room *= 2;
    return unsigned(std::min<std::size_t>(room, TextLayout::MAX_GLYPHS));
}

} // namespace

PlacedGlyphs::PlacedGlyphs(const SharedPtr<VertexBufferCache>& cache) : m_cache(cache) {}

PlacedGlyphs::~PlacedGlyphs() = default;

void PlacedGlyphs::clear()
{
    m_glyphs.clear();
    m_isMade = false;
}

void PlacedGlyphs::add(const GlyphCache::Key& key, float x, float y)
{
    m_glyphs.push_back({key, x, y, GlyphAtlas::NONE});
}

/// @return false if a glyph of the quads has been dropped.
bool PlacedGlyphs::useAgain(GlyphAtlas& atlas)
{
    return std::all_of(m_used.begin(), m_used.end(),
                       [&atlas](const Used& used) { return atlas.use(used.number, used.id); });
}

/// Puts the glyphs into the atlas, and calls use(first, end) for each range that fits at a time.
/// @return how often.
template <class Use>
int PlacedGlyphs::forEachLot(GlyphCache& cache, const Use& use)
{
    GlyphAtlas& atlas = cache.getAtlas();
    int lots = 0;
    for (std::size_t first = 0; first < m_glyphs.size(); ++lots)
    {
        atlas.beginUse();
        std::size_t end = first;
        while (end < m_glyphs.size() && cache.place(m_glyphs[end].key, m_glyphs[end].number))
            ++end;
        atlas.upload(true);
        use(first, end);
        first = end; // there is always room for one
    }
    return lots;
}

void PlacedGlyphs::noteUsed(const GlyphAtlas& atlas)
{
    m_used.clear();
    for (const Glyph& glyph : m_glyphs)
    {
        if (glyph.number != GlyphAtlas::NONE)
            m_used.push_back({glyph.number, atlas.getEntry(glyph.number).id});
    }
    std::sort(m_used.begin(), m_used.end(), [](const Used& a, const Used& b) { return a.number < b.number; });
    m_used.erase(std::unique(m_used.begin(), m_used.end(),
                             [](const Used& a, const Used& b) { return a.number == b.number; }),
                 m_used.end());
}

/// @param isForScene  y upwards, without spare capacity.
/// @param quads  existing ones are filled again if their capacity suffices.
/// @param count  how many of them are filled.
/// @return false without memory (logged).
bool PlacedGlyphs::fillQuads(const GlyphAtlas& atlas, std::size_t first, std::size_t end, float scale,
                             bool isForScene, Quads& quads, std::size_t& count)
{
    m_next.assign(atlas.getPageCount(), 0);
    for (std::size_t i = first; i < end; ++i)
    {
        if (m_glyphs[i].number != GlyphAtlas::NONE)
            ++m_next[atlas.getEntry(m_glyphs[i].number).page];
    }
    count = 0;
    for (unsigned page = 0; page < m_next.size(); ++page)
    {
        const std::size_t start = count;
        for (std::size_t left = m_next[page], wanted = 0; left > 0; left -= wanted)
        {
            wanted = std::min<std::size_t>(left, TextLayout::MAX_GLYPHS);
            if (count == quads.size())
                quads.emplace_back();
            std::unique_ptr<GlyphQuads>& place = quads[count++];
            if (!place || place->getRoom() < wanted)
                place = std::make_unique<GlyphQuads>(isForScene ? unsigned(wanted) : findRoom(wanted));
            if (place->getRoom() < wanted)
                return false;
            place->start(page, unsigned(wanted));
        }
        m_next[page] = start;
    }
    const float ySign = isForScene ? -1.0f : 1.0f;
    const auto pageSize = float(atlas.getPageSize());
    for (std::size_t i = first; i < end; ++i)
    {
        const Glyph& glyph = m_glyphs[i];
        if (glyph.number == GlyphAtlas::NONE)
            continue;
        const GlyphAtlas::Entry& entry = atlas.getEntry(glyph.number);
        std::size_t& next = m_next[entry.page];
        quads[next]->add(entry, pageSize, (glyph.x + float(entry.offsetX)) * scale,
                         ySign * (glyph.y + float(entry.offsetY)) * scale, float(entry.width) * scale,
                         ySign * float(entry.height) * scale);
        if (quads[next]->isFull())
            quads[next++]->end();
    }
    return true;
}

void PlacedGlyphs::draw(GlyphCache& cache, RenderContext& context, const Colour4f& colour)
{
    if (context.getViewportWidth() <= 0 || context.getViewportHeight() <= 0)
        return;
    GlyphAtlas& atlas = cache.getAtlas();
    atlas.beginUse();
    if (m_isMade && useAgain(atlas))
    {
        atlas.upload(false); // glyphs of other texts may be pending on these pages
        drawQuads(atlas, context, colour);
        return;
    }
    bool isSent = true;
    const int lots =
        forEachLot(cache,
                   [&](std::size_t first, std::size_t end)
                   {
                       isSent =
                           fillQuads(atlas, first, end, 1.0f, false, m_quads, m_quadsCount) && sendQuads();
                       if (isSent)
                           drawQuads(atlas, context, colour);
                   });
    m_isMade = lots == 1 && isSent;
    if (m_isMade)
        noteUsed(atlas);
}

/// @return false without memory (logged).
bool PlacedGlyphs::sendQuads()
{
    bool isSent = true;
    for (std::size_t i = 0; i < m_quadsCount; ++i)
        isSent = m_quads[i]->send(*m_cache) && isSent;
    return isSent;
}

void PlacedGlyphs::drawQuads(GlyphAtlas& atlas, RenderContext& context, const Colour4f& colour)
{
    Matrix4f projection = Matrix4f::IDENTITY;
    projection[0].x = 2.0f / float(context.getViewportWidth());
    projection[1].y = -2.0f / float(context.getViewportHeight());
    projection[3] = Vector4f(-1.0f, 1.0f, 0.0f, 1.0f);
    const RenderContext::DrawScope scope(context);
    for (std::size_t i = 0; i < m_quadsCount; ++i)
    {
        GlyphAtlas::Look& look = atlas.getLook(m_quads[i]->getPage());
        if (!look.appearance)
            continue;
        look.projection->set(projection);
        if (!isSame(look.colour, colour))
        {
            look.appearance->setProperty("M_DIFFUSE_COLOUR", Vector4f(colour.r, colour.g, colour.b, 1.0f));
            look.appearance->setProperty("M_OPACITY", colour.a);
            look.colour = colour;
        }
        m_quads[i]->getSolid()->draw(context, *look.appearance);
    }
}

SharedPtr<Solid> PlacedGlyphs::createSolid(GlyphCache& cache, AssetCachePool& pool,
                                           const SharedPtr<ShaderProgram>& program, const Colour4f& colour,
                                           float scale)
{
    GlyphAtlas& atlas = cache.getAtlas();
    SharedPtr<Solid> top;
    bool isComplete = true;
    const auto add = [&](GlyphQuads& quads)
    {
        const SharedPtr<Texture2D> texture = atlas.takeTexture(quads.getPage());
        const SharedPtr<Appearance> appearance =
            texture ? makeInkAppearance(program, texture, colour) : SharedPtr<Appearance>();
        const SharedPtr<Mesh> mesh = appearance ? quads.makeMesh(pool) : SharedPtr<Mesh>();
        const auto solid = mesh ? makeShared<Solid>(mesh, appearance) : SharedPtr<Solid>();
        isComplete = isComplete && solid;
        if (!top)
            top = solid;
        else if (solid)
            solid->setParent(top, false);
    };
    forEachLot(cache,
               [&](std::size_t first, std::size_t end)
               {
                   Quads quads;
                   std::size_t count = 0;
                   isComplete = fillQuads(atlas, first, end, scale, true, quads, count) && isComplete;
                   for (std::size_t i = 0; i < count && isComplete; ++i)
                       add(*quads[i]);
               });
    m_isMade = false;
    return isComplete ? top : SharedPtr<Solid>();
}

} // namespace orv::detail
