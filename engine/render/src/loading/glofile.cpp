#include "orv/glo.h"

#include "globuilder.h"

#include "orv/assetcachepool.h"
#include "orv/detail/glolog.h"
#include "orv/detail/gloreader.h"
#include "orv/detail/loadscope.h"

#include <algorithm>

namespace orv
{

SharedPtr<Glo> loadGloFile(AssetCachePool& pool, const SharedPtr<SceneNode>& parent, const char* name,
                           bool measuresMeshes)
{
    return loadGloFile(pool, parent, name, measuresMeshes ? MeshData::BOUNDS : MeshData::NONE);
}

SharedPtr<Glo> loadGloFile(AssetCachePool& pool, const SharedPtr<SceneNode>& parent, const char* name,
                           MeshData meshData)
{
    const detail::LoadScope scope(name);
    const SharedPtr<Stream> stream = name ? pool.getStream(name) : SharedPtr<Stream>();
    if (!stream)
    {
        ORV_GLO_ERROR("GLO file %s cannot be opened", name ? name : "(null)");
        if (name)
            pool.explainMissing(name);
        return {};
    }
    detail::LoadScope::addRead(uint64_t(std::max(stream->size(), 0)));
    detail::GloGeometries geometries(pool, meshData, name);
    detail::GloReader reader(*stream, geometries, name);
    if (!reader.read())
        return {};
    detail::GloBuilder builder(pool, reader.scene(), geometries, reader.version(), reader.tool(),
                               uint32_t(std::max(stream->size(), 0)), name);
    return builder.build(parent);
}

} // namespace orv
