#pragma once

#include "glyphatlas.h"

#include "orv/vertexarray.h"

namespace orv
{

class AssetCachePool;
class Mesh;
class Solid;
class VertexBufferCache;

namespace detail
{

/// The glyphs of one page that one draw takes: a square for each, with room for more of them.
///
/// Over a frame they are in one GL buffer that is filled again: what there is no glyph for has no size. For a scene they go
/// into a buffer once.
class GlyphQuads
{
public:
    /// @param count  that there is to be room for. Without memory (logged) there is none.
    explicit GlyphQuads(unsigned count);
    ~GlyphQuads();

    unsigned getRoom() const { return m_room; }

    /// Begins again, without glyphs. @param count  that will be added, up to getRoom().
    void start(unsigned page, unsigned count);
    /// @param x,y  of its upper left corner; @param width,height  downwards and to the right of it, or else negative.
    void add(const GlyphAtlas::Entry& entry, float pageSize, float x, float y, float width, float height);
    bool isFull() const { return m_count == m_wanted; }
    /// Hides what is left of the time before.
    void end();

    unsigned getPage() const { return m_page; }

    /// Fills the buffer. @return false where memory lacks (logged).
    bool send(VertexBufferCache& cache);
    /// What shows over a frame what was sent.
    const SharedPtr<Solid>& getSolid() const { return m_solid; }

    /// @return a mesh in a buffer of the pool; the quads are of no use any more. Empty where memory lacks.
    SharedPtr<Mesh> makeMesh(AssetCachePool& pool);

private:
    SharedPtr<VertexArray> m_vertices;
    SharedPtr<Solid> m_solid;
    unsigned m_page = 0;
    unsigned m_room = 0;
    unsigned m_wanted = 0;
    unsigned m_count = 0;
    unsigned m_shown = 0; ///< of the time before
};

} // namespace detail
} // namespace orv
