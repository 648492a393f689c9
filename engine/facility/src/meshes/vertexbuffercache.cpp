#include "orv/vertexbuffercache.h"

namespace orv
{

VertexBufferCache::VertexBufferCache() = default;
VertexBufferCache::~VertexBufferCache() = default;

VertexBuffer::Ptr VertexBufferCache::create(const char* name)
{
    const auto resource = makeShared<detail::BufferResource>();
    getResourceCache()->add(resource);
    const VertexBuffer::Ptr buffer = makeShared<VertexBuffer>(resource);
    if (buffer)
        add(buffer, name);
    return buffer;
}

} // namespace orv
