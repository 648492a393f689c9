#include "orv/indexbuffercache.h"

#include <algorithm>
#include <climits>

namespace orv
{

namespace
{

SharedPtr<detail::BufferResource> createResource(IndexBufferCache& cache)
{
    const auto resource = makeShared<detail::BufferResource>();
    cache.getResourceCache()->add(resource);
    return resource;
}

} // namespace

IndexBufferCache::IndexBufferCache() = default;
IndexBufferCache::~IndexBufferCache() = default;

IndexBuffer::Ptr IndexBufferCache::create(IndexBuffer::Primitive primitive, unsigned int count,
                                          const unsigned short* indices, const char* name)
{
    const auto resource = createResource(*this);
    IndexBuffer::Ptr buffer;
    if (count <= INT_MAX)
        buffer = makeShared<IndexBuffer>(primitive, int(count), true, resource);
    if (!buffer || !buffer->getIndices())
    {
        ORV_LOG_ERROR("Failed to allocate index buffer array");
        return {};
    }
    if (indices)
        std::copy_n(indices, count, buffer->getIndices());
    else
        std::fill_n(buffer->getIndices(), count, 0);
    add(buffer, name);
    return buffer;
}

IndexBuffer::Ptr create(IndexBufferCache& cache, IndexBuffer::Primitive primitive, unsigned int count,
                        const char* name)
{
    const IndexBuffer::Ptr buffer = makeShared<IndexBuffer>(
        primitive, int(std::min(count, unsigned(INT_MAX))), false, createResource(cache));
    if (buffer)
        cache.add(buffer, name);
    return buffer;
}

} // namespace orv
