#pragma once

#include "orv/assetcache.h"
#include "orv/export.h"
#include "orv/texture.h"
#include "orv/texture2d.h"

namespace orv
{

class RenderContext;

/// Makes 2D textures and holds them by name. GL thread only.
///
/// A name that is held already is replaced; a null name makes the texture unnamed.
class ORV_API Texture2DCache : public AssetCache<Texture2D>
{
public:
    using Ptr = SharedPtr<Texture2DCache>;

    Texture2DCache();
    ~Texture2DCache() override;

    /// A texture of power-of-two sizes repeats and has mipmaps; any other clamps and has none. Depth textures
    /// clamp and have none.
    /// @param pixels  width x height pixels without padding, in the order in which v grows; null leaves them
    ///                undefined.
    /// @return empty for a size of 0, for a format or type outside its enum, or when GL has no texture.
    SharedPtr<Texture2D> create(unsigned width, unsigned height, Texture::Format format, Texture::Type type,
                                const void* pixels, const char* name);

    /// Takes over a GL texture that exists already; without memory for it, deletes it.
    /// @param bytesPerPixel  between 0 and 1 for a compressed texture.
    SharedPtr<Texture2D> create(unsigned width, unsigned height, float bytesPerPixel, bool hasMipmaps,
                                unsigned glName, const char* name);

    /// Copies what the bound framebuffer shows in a rectangle of the viewport's size at its lower left corner.
    ///
    /// The texture has no mipmaps, clamps, and is minified by NEAREST. RGB works for every surface; a format
    /// with more channels than the surface has does not.
    /// @return empty for DEPTH, an empty viewport, or when GL refuses the copy (each logged).
    SharedPtr<Texture2D> createFromBackbuffer(const RenderContext& context, Texture::Format format,
                                              const char* name);

    /// A texture for images that come from outside GL (camera or video frames); the caller attaches them.
    /// @return without a name or a place in this cache; empty if the extension is missing (logged).
    SharedPtr<Texture2D> createForExternalSource();

private:
    ORV_LOCAL SharedPtr<detail::TextureResource> createResource();
};

/// Sum over every held texture, largest levels alone.
ORV_API unsigned getTotalAssetSizeInBytes(const Texture2DCache& cache);

} // namespace orv
