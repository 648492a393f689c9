#include "orv/detail/assetstore.h"

#include "orv/detail/loadscope.h"

#include <list>
#include <map>

namespace orv::detail
{

AssetStore::AssetStore() : m_resourceCache(makeShared<ResourceCache>()), m_assetPath(makeShared<AssetPath>())
{
}

AssetStore::~AssetStore() = default;

SharedPtr<Shared> AssetStore::getAsset(const char* name)
{
    if (!name)
        return {};
    const std::string normalized = normalizeAssetName(name);
    const auto held = m_named.find(normalized);
    if (held != m_named.end())
        return held->second;

    const LoadScope scope(normalized.c_str());
    if (LoadScope::hasFailed(this, normalized))
        return {};
    SharedPtr<Shared> asset = load(normalized.c_str());
    if (asset)
    {
        m_named[normalized] = asset;
        return asset;
    }
    m_named.erase(normalized); // what a loader created under the name before it failed
    LoadScope::addFailure(this, normalized);
    return {};
}

SharedPtr<Shared> AssetStore::load(const char* name)
{
    std::list<SharedPtr<Shared>> order;
    for (std::size_t i = 0; i < m_loaders.size(); ++i)
    {
        const SharedPtr<Shared> loader = m_loaders[i]; // held: asking it may add loaders
        if (isKnownTo(*loader, name))
            order.push_front(loader);
        else
            order.push_back(loader);
    }
    for (const SharedPtr<Shared>& loader : order)
    {
        if (SharedPtr<Shared> asset = loadWith(*loader, name))
            return asset;
    }
    return {};
}

bool AssetStore::exists(const char* name) const
{
    return name && m_named.find(normalizeAssetName(name)) != m_named.end();
}

void AssetStore::addAsset(const SharedPtr<Shared>& asset, const char* name)
{
    if (name)
        m_named[normalizeAssetName(name)] = asset;
    else
        m_unnamed.push_back(asset);
}

void AssetStore::addLoader(const SharedPtr<Shared>& loader)
{
    if (loader)
        m_loaders.push_back(loader);
    else
        m_lacksLoader = true;
}

void AssetStore::flush()
{
    // An asset may be held under several names (like the error program), so all of the cache's own references are
    // subtracted to see whether others hold it.
    std::map<const Shared*, int32_t> others;
    const auto takeOff = [&others](const SharedPtr<Shared>& asset)
    { --others.try_emplace(asset.get(), asset ? asset->sharedGetCount() : 0).first->second; };
    for (const auto& entry : m_named)
        takeOff(entry.second);
    for (const SharedPtr<Shared>& asset : m_unnamed)
        takeOff(asset);

    const auto isUnused = [&others](const SharedPtr<Shared>& asset) { return others[asset.get()] <= 0; };
    std::erase_if(m_named, [&isUnused](const auto& entry) { return isUnused(entry.second); });
    std::erase_if(m_unnamed, isUnused);
    m_resourceCache->flush();
}

void AssetStore::clear()
{
    m_named.clear();
    m_unnamed.clear();
}

void AssetStore::registerSource(const SharedPtr<StreamSource>& source)
{
    m_assetPath->add(source);
}

void AssetStore::setCacheSource(const SharedPtr<StreamSource>& source)
{
    m_cacheSource = source;
}

SharedPtr<Stream> AssetStore::getStream(const char* name) const
{
    return m_assetPath->find(name);
}

SharedPtr<Stream> openCacheStream(const SharedPtr<StreamSource>& cacheSource, const char* name, bool writable)
{
    SharedPtr<StreamSource> source; // keeps the source alive: opening may replace it
    source = cacheSource;
    if (!source)
        return {};
    if (writable)
        source->makeFolders(name);
    return source->open(name, writable);
}

SharedPtr<Stream> AssetStore::getCacheStream(const char* name, bool writable) const
{
    return openCacheStream(m_cacheSource, name, writable);
}

} // namespace orv::detail
