#include "orv/assetcachepool.h"

#include "orv/indexbuffercache.h"
#include "orv/memfilesource.h"
#include "orv/meshcache.h"
#include "orv/shaderprogramcache.h"
#include "orv/shaderprogramloader.h"
#include "orv/texture2dcache.h"
#include "orv/texture2dloader.h"
#include "orv/texturecubecache.h"
#include "orv/texturecubeloader.h"
#include "orv/vertexbuffercache.h"

namespace orv
{

AssetCachePool::AssetCachePool()
    : m_assetPath(makeShared<detail::AssetPath>())
    , m_indexBufferCache(makeShared<IndexBufferCache>())
    , m_shaderProgramCache(makeShared<ShaderProgramCache>())
    , m_texture2DCache(makeShared<Texture2DCache>())
    , m_textureCubeCache(makeShared<TextureCubeCache>())
    , m_vertexBufferCache(makeShared<VertexBufferCache>())
    , m_meshCache(makeShared<MeshCache>(m_indexBufferCache, m_vertexBufferCache))
{
    m_shaderProgramCache->registerLoader(makeShared<ShaderProgramLoader>());
    m_texture2DCache->registerLoader(makeShared<Texture2DLoader>());
    m_textureCubeCache->registerLoader(makeShared<TextureCubeLoader>());
    registerSource(create_memfilesource_orv());
    registerSource(create_memfilesource_luvane());
}

AssetCachePool::~AssetCachePool() = default;

/// The order matters to flush(): index buffers before the meshes that hold them, vertex buffers after.
template <class Operation>
void AssetCachePool::forEachCache(const Operation& operation)
{
    operation(*m_indexBufferCache);
    operation(*m_meshCache);
    operation(*m_shaderProgramCache);
    operation(*m_texture2DCache);
    operation(*m_textureCubeCache);
    operation(*m_vertexBufferCache);
}

void AssetCachePool::registerSource(const SharedPtr<StreamSource>& source)
{
    m_assetPath->add(source);
    forEachCache([&source](auto& cache) { cache.registerSource(source); });
}

void AssetCachePool::setCacheSource(const SharedPtr<StreamSource>& source)
{
    m_cacheSource = source;
    forEachCache([&source](auto& cache) { cache.setCacheSource(source); });
}

SharedPtr<Stream> AssetCachePool::getStream(const char* name) const
{
    return m_assetPath->find(name);
}

SharedPtr<Stream> AssetCachePool::getCacheStream(const char* name, bool writable) const
{
    return m_cacheSource ? m_cacheSource->open(name, writable) : SharedPtr<Stream>();
}

void AssetCachePool::flush()
{
    forEachCache([](auto& cache) { cache.flush(); });
}

void AssetCachePool::release()
{
    forEachCache([](auto& cache) { cache.getResourceCache()->release(); });
}

void registerSource(AssetCachePool& pool, const char* path, bool archive)
{
    pool.registerSource(StreamSource::get(path, archive));
}

void setCacheSource(AssetCachePool& pool, const char* path)
{
    pool.setCacheSource(StreamSource::get(path, false));
}

} // namespace orv
