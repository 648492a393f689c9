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

/// The glyphs of one page for one draw: a quad for each, with spare capacity.
///
/// Over a frame they are in one GL buffer that is filled again; unused quads have no area. For a scene they go into a
/// new buffer once.
class GlyphQuads
{
public:
    /// @param count  capacity; without memory (logged) it is 0.
    explicit GlyphQuads(unsigned count);
    ~GlyphQuads();

    unsigned getRoom() const { return m_room; }

    /// Removes all glyphs. @param count  that will be added, up to getRoom().
    void start(unsigned page, unsigned count);
    /// @param x,y  of its upper left corner; @param width,height  to the right and downwards, else negative.
    void add(const GlyphAtlas::Entry& entry, float pageSize, float x, float y, float width, float height);
    bool isFull() const { return m_count == m_wanted; }
    /// Hides the remaining quads of the last time.
    void end();

    unsigned getPage() const { return m_page; }

    /// Fills the buffer. @return false without memory (logged).
    bool send(VertexBufferCache& cache);
    /// The solid that draws the sent quads over a frame.
    const SharedPtr<Solid>& getSolid() const { return m_solid; }

    /// @return a mesh in a buffer of the pool, or empty without memory. The quads cannot be used afterwards.
    SharedPtr<Mesh> makeMesh(AssetCachePool& pool);

private:
    SharedPtr<VertexArray> m_vertices;
    SharedPtr<Solid> m_solid;
    unsigned m_page = 0;
    unsigned m_room = 0;
    unsigned m_wanted = 0;
    unsigned m_count = 0;
    unsigned m_shown = 0; ///< the last time
};

} // namespace detail
} // namespace orv
