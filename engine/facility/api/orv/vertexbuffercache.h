#pragma once

#include "orv/assetcache.h"
#include "orv/vertexbuffer.h"

namespace orv
{

/// Makes vertex buffers and holds them by name. GL thread only.
class ORV_API VertexBufferCache : public AssetCache<VertexBuffer>
{
public:
    VertexBufferCache();
    ~VertexBufferCache() override;

    /// A buffer without attributes; null name = unnamed. GL gets to know of it when it is committed.
    VertexBuffer::Ptr create(const char* name);
};

} // namespace orv
