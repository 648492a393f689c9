#include "orv/assetcachepool.h"

#include "orv/fontcache.h"
#include "orv/indexbuffercache.h"
#include "orv/memfilesource.h"
#include "orv/meshcache.h"
#include "orv/pvrtextureloader.h"
#include "orv/shaderprogramcache.h"
#include "orv/shaderprogramloader.h"
#include "orv/texture2dcache.h"
#include "orv/texture2dloader.h"
#include "orv/texturecubecache.h"
#include "orv/texturecubeloader.h"
#include "orv/vertexbuffercache.h"

#include <algorithm>
#include <iterator>

namespace orv
{

AssetCachePool::AssetCachePool()
    : m_assetPath(makeShared<detail::AssetPath>())
    , m_indexBufferCache(makeShared<IndexBufferCache>())
    , m_shaderProgramCache(makeShared<ShaderProgramCache>())
    , m_texture2DCache(makeShared<Texture2DCache>())
    , m_textureCubeCache(makeShared<TextureCubeCache>())
    , m_vertexBufferCache(makeShared<VertexBufferCache>())
    , m_fontCache(makeShared<FontCache>(m_texture2DCache)) // registers its own loader
    , m_meshCache(makeShared<MeshCache>(m_indexBufferCache, m_vertexBufferCache))
{
    if (!m_assetPath || !areCachesComplete())
        return;
    m_shaderProgramCache->registerLoader(makeShared<ShaderProgramLoader>());
    m_texture2DCache->registerLoader(makeShared<Texture2DLoader>());
    m_texture2DCache->registerLoader(makeShared<PvrTextureLoader>());
    m_textureCubeCache->registerLoader(makeShared<TextureCubeLoader>());
    const SharedPtr<StreamSource> engineAssets = create_memfilesource_orv();
    const SharedPtr<StreamSource> frameworkAssets = create_memfilesource_luvane();
    registerSource(engineAssets);
    registerSource(frameworkAssets);
    m_complete = areCachesComplete() && engineAssets && frameworkAssets;
}

AssetCachePool::~AssetCachePool() = default;

bool AssetCachePool::areCachesComplete() const
{
    const detail::AssetStore* const caches[] = {m_fontCache.get(),        m_indexBufferCache.get(),
                                                m_meshCache.get(),        m_shaderProgramCache.get(),
                                                m_texture2DCache.get(),   m_textureCubeCache.get(),
                                                m_vertexBufferCache.get()};
    return std::all_of(std::begin(caches), std::end(caches),
                       [](const detail::AssetStore* cache) { return cache && cache->isComplete(); });
}

/// The order matters to flush(): fonts before their textures; index buffers before the meshes that hold them,
/// vertex buffers after.
template <class Operation>
void AssetCachePool::forEachCache(const Operation& operation)
{
    operation(*m_fontCache);
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

void AssetCachePool::explainMissing(const char* name) const
{
    m_assetPath->explainMissing(name);
}

SharedPtr<Stream> AssetCachePool::getCacheStream(const char* name, bool writable) const
{
    return detail::openCacheStream(m_cacheSource, name, writable);
}

void AssetCachePool::flush()
{
    forEachCache([](auto& cache) { cache.flush(); });
}

void AssetCachePool::release()
{
    forEachCache([](auto& cache) { cache.getResourceCache()->release(); });
}

void AssetCachePool::forgetContext()
{
    release();
    forEachCache([](auto& cache) { cache.clear(); });
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
