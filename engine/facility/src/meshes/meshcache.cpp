#include "orv/meshcache.h"

namespace orv
{

MeshCache::MeshCache(const SharedPtr<IndexBufferCache>& indexBufferCache,
                     const SharedPtr<VertexBufferCache>& vertexBufferCache)
    : m_indexBufferCache(indexBufferCache)
    , m_vertexBufferCache(vertexBufferCache)
{
}

MeshCache::~MeshCache() = default;

Mesh::Ptr MeshCache::create(const MeshHeader& header, const IndexBuffer::Ptr& indexBuffer,
                            const VertexBuffer::Ptr& vertexBuffer, const char* name)
{
    const Mesh::Ptr mesh = makeShared<Mesh>(header, indexBuffer, vertexBuffer);
    if (mesh)
        add(mesh, name);
    return mesh;
}

} // namespace orv
