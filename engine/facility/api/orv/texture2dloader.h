#pragma once

#include "orv/assetloader.h"
#include "orv/export.h"
#include "orv/texture2d.h"

namespace orv
{

/// Loads JPEG, BMP, PNG and TGA files as 2D textures, their top row first.
///
/// One channel becomes ALPHA, two LUMINANCE_ALPHA, three RGB, four RGBA.
class ORV_API Texture2DLoader : public AssetLoader<Texture2D>
{
public:
    ~Texture2DLoader() override;

    /// @param cache  a Texture2DCache.
    /// @return empty if there is no such file, or, logged, if it is no image.
    SharedPtr<Texture2D> load(AssetCache<Texture2D>& cache, const char* name) override;
    bool isKnown(const char* name) override;
};

} // namespace orv
