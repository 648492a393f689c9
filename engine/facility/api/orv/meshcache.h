#pragma once

#include "orv/assetcache.h"
#include "orv/indexbuffercache.h"
#include "orv/mesh.h"
#include "orv/vertexbuffercache.h"

namespace orv
{

/// Meshes, together with the caches that their buffers come from.
class ORV_API MeshCache : public AssetCache<Mesh>
{
public:
    /// Meshes take their buffers from these caches.
    MeshCache(const SharedPtr<IndexBufferCache>& indexBufferCache,
              const SharedPtr<VertexBufferCache>& vertexBufferCache);
    ~MeshCache() override;

    /// Null name = unnamed.
    Mesh::Ptr create(const MeshHeader& header, const IndexBuffer::Ptr& indexBuffer,
                     const VertexBuffer::Ptr& vertexBuffer, const char* name);

    /// Where the buffers of meshes are kept.
    const SharedPtr<IndexBufferCache>& getIndexBufferCache() const { return m_indexBufferCache; }
    const SharedPtr<VertexBufferCache>& getVertexBufferCache() const { return m_vertexBufferCache; }

private:
    SharedPtr<IndexBufferCache> m_indexBufferCache;
    SharedPtr<VertexBufferCache> m_vertexBufferCache;
};

} // namespace orv
