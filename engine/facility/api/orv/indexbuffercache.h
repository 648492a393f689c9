#pragma once

#include "orv/assetcache.h"
#include "orv/indexbuffer.h"

namespace orv
{

/// Makes index buffers and holds them by name. GL thread only.
class ORV_API IndexBufferCache : public AssetCache<IndexBuffer>
{
public:
    IndexBufferCache();
    ~IndexBufferCache() override;

    /// A buffer of indices in memory, to be committed; null name = unnamed.
    /// @param indices  count of them, copied; null leaves them 0, to be filled through getIndices().
    /// @return empty, after an error, if there is no memory for them.
    IndexBuffer::Ptr create(IndexBuffer::Primitive primitive, unsigned int count,
                            const unsigned short* indices, const char* name);
};

/// A buffer that draws count vertices in their own order; null name = unnamed.
ORV_API IndexBuffer::Ptr create(IndexBufferCache& cache, IndexBuffer::Primitive primitive, unsigned int count,
                                const char* name);

} // namespace orv
