#pragma once

#include "orv/assetcache.h"
#include "orv/export.h"
#include "orv/texture.h"
#include "orv/texturecube.h"

namespace orv
{

/// Makes cube maps and holds them by name. GL thread only.
class ORV_API TextureCubeCache : public AssetCache<TextureCube>
{
public:
    using Ptr = SharedPtr<TextureCubeCache>;

    TextureCubeCache();
    ~TextureCubeCache() override;

    /// A cube without faces. A name that is held already is replaced; a null name makes it unnamed.
    /// @return empty when GL has no texture.
    SharedPtr<TextureCube> create(unsigned width, unsigned height, Texture::Format format, Texture::Type type,
                                  const char* name);
};

namespace detail
{

/// As TextureCubeCache::create(), but the cache holds the resource alone; its owner may deallocate it.
SharedPtr<TextureCube> makeTextureCube(TextureCubeCache& cache, unsigned width, unsigned height,
                                       Texture::Format format, Texture::Type type,
                                       const SharedPtr<TextureResource>& resource);

} // namespace detail

/// Whether the cube made of these six images is held.
ORV_API bool exists(TextureCubeCache& cache, const char* positiveX, const char* negativeX,
                    const char* positiveY, const char* negativeY, const char* positiveZ,
                    const char* negativeZ);

/// The cube made of these six images, loaded if need be.
ORV_API SharedPtr<TextureCube> get(TextureCubeCache& cache, const char* positiveX, const char* negativeX,
                                   const char* positiveY, const char* negativeY, const char* positiveZ,
                                   const char* negativeZ);

} // namespace orv
