#pragma once

#include "orv/sharedptr.h"

namespace orv
{

template <class T>
class AssetCache;

/// Makes assets of one type for a cache that does not hold them yet.
template <class T>
class AssetLoader : public Shared
{
public:
    ORV_CLASS_NAME("AssetLoader")

    /// Loads an asset, as a rule through the cache's creation functions and under the same name.
    /// @param name  already normalised; input is found with cache.getStream().
    /// @return empty if this loader cannot make it.
    virtual SharedPtr<T> load(AssetCache<T>& cache, const char* name) = 0;

    /// Whether the name looks like something this loader reads. Loaders that say yes are asked before those that
    /// say no, which are asked nevertheless.
    virtual bool isKnown(const char* name) = 0;
};

} // namespace orv
