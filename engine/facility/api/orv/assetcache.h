#pragma once

#include "orv/assetloader.h"
#include "orv/detail/assetpath.h"
#include "orv/detail/resource.h"
#include "orv/sharedptr.h"
#include "orv/streamsource.h"

#include <deque>
#include <list>
#include <map>
#include <string>
#include <unordered_map>
#include <vector>

namespace orv
{

/// Assets of one type, held by name, with the loaders that make them.
///
/// An asset stays until a flush() that finds nobody else holding it; there is no limit by size or age. Names are
/// compared exactly, after detail::normalizeAssetName(). Creating an asset under a name that is held replaces it.
/// Threads: the GL thread only. Loading and flush() make GL calls.
template <class T>
class AssetCache : public Shared
{
public:
    ORV_CLASS_NAME("AssetCache")

    AssetCache()
        : m_resourceCache(makeShared<detail::ResourceCache>())
        , m_assetPath(makeShared<detail::AssetPath>())
    {
    }

    /// The asset of this name, loaded if it is not held.
    /// @return empty if no loader can make it; that is not remembered, so the next call asks the loaders again.
    SharedPtr<T> get(const char* name)
    {
        if (!name)
            return {};
        const std::string normalized = detail::normalizeAssetName(name);
        const auto held = m_named.find(normalized);
        if (held != m_named.end())
            return held->second;

        SharedPtr<T> asset = load(normalized.c_str());
        if (asset)
            m_named[normalized] = asset;
        else
            m_named.erase(normalized); // what a loader created under the name before it failed
        return asset;
    }

    /// Whether the cache holds the name; loaders are not asked.
    bool exists(const char* name) const
    {
        return name && m_named.find(detail::normalizeAssetName(name)) != m_named.end();
    }

    /// Takes an asset in under a name, or unnamed if the name is null.
    void add(const SharedPtr<T>& asset, const char* name)
    {
        if (name)
            m_named[detail::normalizeAssetName(name)] = asset;
        else
            m_unnamed.push_back(asset);
    }

    void registerLoader(const SharedPtr<AssetLoader<T>>& loader)
    {
        if (loader)
            m_loaders.push_back(loader);
    }

    /// Drops every asset that only this cache holds, then deletes the GL objects that nobody uses any more.
    void flush()
    {
        // An asset may be held under several names (the error program is), so all of the cache's own references
        // are taken off before the count says whether anybody else holds it.
        std::unordered_map<const T*, int32_t> others;
        forEachAsset(
            [&others](const SharedPtr<T>& asset)
            { --others.try_emplace(asset.get(), asset ? asset->sharedGetCount() : 0).first->second; });
        const auto isUnused = [&others](const SharedPtr<T>& asset) { return others[asset.get()] <= 0; };

        std::erase_if(m_named, [&isUnused](const auto& entry) { return isUnused(entry.second); });
        std::erase_if(m_unnamed, isUnused);
        m_resourceCache->flush();
    }

    /// Appends a source to the cache's path.
    void registerSource(const SharedPtr<StreamSource>& source) { m_assetPath->add(source); }

    /// Where derived data is kept (compiled shader programs); empty for nowhere.
    void setCacheSource(const SharedPtr<StreamSource>& source) { m_cacheSource = source; }

    /// Opens a file on the cache's path. @return empty if it is nowhere on it.
    SharedPtr<Stream> getStream(const char* name) const { return m_assetPath->find(name); }

    /// Opens a file of derived data. @return empty without a cache source or where the source cannot open it.
    SharedPtr<Stream> getCacheStream(const char* name, bool writable) const
    {
        return m_cacheSource ? m_cacheSource->open(name, writable) : SharedPtr<Stream>();
    }

    const SharedPtr<detail::ResourceCache>& getResourceCache() const { return m_resourceCache; }
    const SharedPtr<detail::AssetPath>& getAssetPath() const { return m_assetPath; }

    /// Calls visit(const SharedPtr<T>&) for every entry, named ones first; an asset under two names comes twice.
    /// The visitor must not change the cache.
    template <class Visitor>
    void forEachAsset(Visitor&& visit) const
    {
        for (const auto& entry : m_named)
            visit(entry.second);
        for (const SharedPtr<T>& asset : m_unnamed)
            visit(asset);
    }

private:
    SharedPtr<T> load(const char* name)
    {
        std::deque<SharedPtr<AssetLoader<T>>> order;
        for (const SharedPtr<AssetLoader<T>>& loader : m_loaders)
        {
            if (loader->isKnown(name))
                order.push_front(loader);
            else
                order.push_back(loader);
        }
        for (const SharedPtr<AssetLoader<T>>& loader : order)
        {
            if (SharedPtr<T> asset = loader->load(*this, name))
                return asset;
        }
        return {};
    }

    SharedPtr<detail::ResourceCache> m_resourceCache;
    SharedPtr<detail::AssetPath> m_assetPath;
    SharedPtr<StreamSource> m_cacheSource;
    std::map<std::string, SharedPtr<T>> m_named;
    std::list<SharedPtr<T>> m_unnamed;
    std::vector<SharedPtr<AssetLoader<T>>> m_loaders;
};

} // namespace orv
