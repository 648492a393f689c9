#pragma once

#include "glyphatlas.h"

#include "orv/glyphcache.h"

#include <cstddef>
#include <memory>
#include <vector>

namespace orv
{

class AssetCachePool;
class RenderContext;
class Solid;
class VertexBufferCache;

namespace detail
{

class GlyphQuads;

/// Placed glyphs, and the quads that draw them.
class PlacedGlyphs
{
public:
    /// @param cache  shared; where the buffers for drawing over a frame are made.
    explicit PlacedGlyphs(const SharedPtr<VertexBufferCache>& cache);
    ~PlacedGlyphs();

    void clear();
    /// @param x,y  of the pen on the baseline, whole pixels; y downwards.
    void add(const GlyphCache::Key& key, float x, float y);

    /// See TextLayout. @param cache  the same each time.
    void draw(GlyphCache& cache, RenderContext& context, const Colour4f& colour);

    /// See TextLayout, but without messages. @param scale  units for a pixel.
    SharedPtr<Solid> createSolid(GlyphCache& cache, AssetCachePool& pool,
                                 const SharedPtr<ShaderProgram>& program, const Colour4f& colour,
                                 float scale);

private:
    struct Glyph
    {
        GlyphCache::Key key;
        float x, y;
        uint32_t number; ///< in the atlas, if it was there last time
    };

    /// A glyph of the atlas that is drawn.
    struct Used
    {
        uint32_t number;
        uint64_t id;
    };

    using Quads = std::vector<std::unique_ptr<GlyphQuads>>;

    bool useAgain(GlyphAtlas& atlas);
    template <class Use>
    int forEachLot(GlyphCache& cache, const Use& use);
    void noteUsed(const GlyphAtlas& atlas);
    bool fillQuads(const GlyphAtlas& atlas, std::size_t first, std::size_t end, float scale, bool isForScene,
                   Quads& quads, std::size_t& count);
    bool sendQuads();
    void drawQuads(GlyphAtlas& atlas, RenderContext& context, const Colour4f& colour);

    SharedPtr<VertexBufferCache> m_cache;
    std::vector<Glyph> m_glyphs;
    std::vector<Used> m_used;        ///< each glyph of m_glyphs once
    std::vector<std::size_t> m_next; ///< for each page: the number of glyphs, then the quads for the next one
    Quads m_quads;
    std::size_t m_quadsCount = 0; ///< of m_quads that are drawn
    bool m_isMade = false;        ///< m_quads show all of m_glyphs, as long as m_used are where they were
};

} // namespace detail
} // namespace orv
