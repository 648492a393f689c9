#pragma once

#include "orv/detail/assetpath.h"
#include "orv/detail/resource.h"
#include "orv/sharedptr.h"
#include "orv/streamsource.h"

#include <list>
#include <map>
#include <string>
#include <vector>

namespace orv::detail
{

/// Everything of an AssetCache that does not depend on the type of its assets, so that the code of it stands in
/// the library once.
class ORV_API AssetStore : public Shared
{
public:
    ORV_CLASS_NAME("AssetCache")

    ~AssetStore() override;

    /// Whether the cache holds the name; loaders are not asked.
    bool exists(const char* name) const;

    /// Drops every asset that only this cache holds, then deletes the GL objects that are no longer used.
    void flush();

    /// Whether there was memory for its parts and loaders.
    bool isComplete() const { return m_resourceCache && m_assetPath && !m_lacksLoader; }

    /// Releases every asset, even those held elsewhere; makes no GL call.
    void clear();

    /// Appends a source to the cache's path.
    void registerSource(const SharedPtr<StreamSource>& source);

    /// Where derived data is kept (compiled shader programs); empty for nowhere.
    void setCacheSource(const SharedPtr<StreamSource>& source);

    /// Opens a file on the cache's path. @return empty if it is nowhere on it.
    SharedPtr<Stream> getStream(const char* name) const;

    /// Opens a file of derived data; for writing, the source makes the folders of its name.
    /// @return empty without a cache source or where the source cannot open it.
    SharedPtr<Stream> getCacheStream(const char* name, bool writable) const;

    const SharedPtr<ResourceCache>& getResourceCache() const { return m_resourceCache; }
    const SharedPtr<AssetPath>& getAssetPath() const { return m_assetPath; }

protected:
    AssetStore();

    SharedPtr<Shared> getAsset(const char* name);
    void addAsset(const SharedPtr<Shared>& asset, const char* name);
    void addLoader(const SharedPtr<Shared>& loader);

    const std::map<std::string, SharedPtr<Shared>>& getNamed() const { return m_named; }
    const std::list<SharedPtr<Shared>>& getUnnamed() const { return m_unnamed; }

private:
    // The two operations of a loader, which has the type of the assets.
    virtual bool isKnownTo(Shared& loader, const char* name) = 0;
    virtual SharedPtr<Shared> loadWith(Shared& loader, const char* name) = 0;

    SharedPtr<Shared> load(const char* name);

    SharedPtr<ResourceCache> m_resourceCache;
    SharedPtr<AssetPath> m_assetPath;
    SharedPtr<StreamSource> m_cacheSource;
    std::map<std::string, SharedPtr<Shared>> m_named;
    std::list<SharedPtr<Shared>> m_unnamed;
    std::vector<SharedPtr<Shared>> m_loaders;
    bool m_lacksLoader = false;
};

/// Opens a stream of a source that caches are kept in; for writing, its folders are made.
/// @param cacheSource  may be replaced while it is asked; empty gives an empty stream.
SharedPtr<Stream> openCacheStream(const SharedPtr<StreamSource>& cacheSource, const char* name,
                                  bool writable);

} // namespace orv::detail
