#pragma once

#include "orv/assetloader.h"
#include "orv/detail/assetstore.h"

namespace orv
{

/// Assets of one type, held by name, with the loaders that make them.
///
/// An asset stays until a flush() finds that only the cache holds it; there is no limit by size or age. Names are
/// compared exactly, after detail::normalizeAssetName(). Creating an asset under a name that is held replaces it.
/// What does not depend on the type (flush(), sources, streams) is inherited.
/// Threads: the GL thread only. Loading and flush() make GL calls.
template <class T>
class AssetCache : public detail::AssetStore
{
public:
    /// The asset of this name, loaded if it is not held.
    /// @return empty if no loader can make it. The next call asks the loaders again, unless it is of the same load.
    SharedPtr<T> get(const char* name) { return typed(getAsset(name)); }

    /// Takes an asset in under a name, or unnamed if the name is null.
    void add(const SharedPtr<T>& asset, const char* name) { addAsset(asset, name); }

    /// Adds a loader behind those that are there.
    void registerLoader(const SharedPtr<AssetLoader<T>>& loader) { addLoader(loader); }

    /// Calls visit(const SharedPtr<T>&) for every entry, named ones first; an asset under two names comes twice.
    /// The visitor must not change the cache.
    template <class Visitor>
    void forEachAsset(Visitor&& visit) const
    {
        for (const auto& entry : getNamed())
            visit(typed(entry.second));
        for (const SharedPtr<Shared>& asset : getUnnamed())
            visit(typed(asset));
    }

    /// The name that an asset is held under, the first of several; null if there is none. Until the cache changes.
    const char* findName(const T& asset) const
    {
        for (const auto& entry : getNamed())
        {
            if (entry.second.get() == &asset)
                return entry.first.c_str();
        }
        return nullptr;
    }

private:
    bool isKnownTo(Shared& loader, const char* name) override
    {
        return static_cast<AssetLoader<T>&>(loader).isKnown(name);
    }

    SharedPtr<Shared> loadWith(Shared& loader, const char* name) override
    {
        return static_cast<AssetLoader<T>&>(loader).load(*this, name);
    }

    /// Only a T and its loaders are ever stored.
    static SharedPtr<T> typed(const SharedPtr<Shared>& asset) { return static_cast<T*>(asset.get()); }
};

} // namespace orv
