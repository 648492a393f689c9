#pragma once

#include "orv/detail/drawcall.h"
#include "orv/export.h"
#include "orv/sharedptr.h"

#include <cstdint>
#include <memory>

namespace orv
{

class RenderContext;

namespace detail
{
class BufferResource;
}

/// What a vertex buffer's vertices are drawn as, and, unless they are drawn in their own order, the 16-bit
/// indices that pick them.
///
/// The indices start in memory; commit() moves them into a GL buffer. After the context was lost
/// (AssetCachePool::release()) a committed buffer draws nothing; it has to be made again.
/// Threads: the GL thread only.
class ORV_API IndexBuffer : public Shared
{
public:
    ORV_CLASS_NAME("IndexBuffer")
    using Ptr = SharedPtr<IndexBuffer>;

    /// The order is the engine's own, not GL's.
    enum class Primitive : int32_t
    {
        POINTS = 0,
        LINE_STRIP = 1,
        LINE_LOOP = 2,
        LINES = 3,
        TRIANGLE_STRIP = 4,
        TRIANGLE_FAN = 5,
        TRIANGLES = 6
    };

    /// Buffers normally come from IndexBufferCache::create(), whose resource cache must know the resource.
    /// @param count     indices, or vertices where there are none; a negative one counts as 0.
    /// @param allocate  whether there are indices, of no particular values yet. getIndices() is null if memory lacks.
    IndexBuffer(Primitive primitive, int count, bool allocate,
                const SharedPtr<detail::BufferResource>& resource);
    ~IndexBuffer() override;

    /// Moves the indices from memory into the GL buffer. Without indices in memory, or where GL has no buffer
    /// (logged), nothing changes.
    void commit();

    /// The same with getCount() indices elsewhere in memory, for a buffer without any. Where GL has no buffer it keeps a
    /// copy of them.
    /// @param indices  borrowed for the call.
    /// @return false, after logging, if there is no memory for that.
    ORV_LOCAL bool commit(const unsigned short* indices);

    /// Draws with the vertex inputs that are set up. An unknown primitive is logged and drawn as points.
    void draw();

    /// Draw path: the same through what the context remembers; the element buffer stays bound.
    void draw(RenderContext& context) { bind(context).issue(); }

    /// The same but for the call of GL that draws.
    detail::DrawCall bind(RenderContext& context);

    /// What the indices make, and how many there are.
    Primitive getPrimitive() const { return m_primitive; }
    int getCount() const { return m_count; }

    /// The indices in memory, to be filled or read; null once committed or where there are none.
    unsigned short* getIndices() { return m_indices.get(); }
    const unsigned short* getIndices() const { return m_indices.get(); }

    /// Whether there are indices, in memory or committed: false draws the vertices in order.
    bool isIndexed() const { return m_indices || m_committed; }

    /// A disabled buffer draws nothing; enabled at first.
    void setEnabled(bool enabled) { m_enabled = enabled; }
    bool isEnabled() const { return m_enabled; }

    unsigned int getId() const; ///< GL buffer name, 0 if there is none.

private:
    ORV_LOCAL bool upload(const unsigned short* indices);

    Primitive m_primitive;
    std::unique_ptr<unsigned short[]> m_indices;
    int m_count;
    SharedPtr<detail::BufferResource> m_resource;
    bool m_enabled = true;
    bool m_committed = false; ///< The indices moved to the GL buffer, which a lost context may have taken.
};

/// Triangles that the buffer draws: count - 2 for strips and fans (-1 for a single index), count / 3 for triangle
/// lists, 0 otherwise.
ORV_API int getTriangleCount(const IndexBuffer& buffer);

} // namespace orv
