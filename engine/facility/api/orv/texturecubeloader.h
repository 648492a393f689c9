#pragma once

#include "orv/assetloader.h"
#include "orv/export.h"
#include "orv/texturecube.h"

namespace orv
{

/// Loads cube maps from JPEG, BMP, PNG and TGA files, channels as for 2D textures.
///
/// A name without ";" is one image, a grid of 3 columns and 2 rows: -x, -z, +x above -y, +y, +z. Otherwise
/// the name is six image names separated by ";", in the order +x, -x, +y, -y, +z, -z; white space around each
/// is cut off. All images of one cube have the same size and channel count, and faces are square. Nothing is left
/// in GL unless everything fits (each refusal is logged).
class ORV_API TextureCubeLoader : public AssetLoader<TextureCube>
{
public:
    ~TextureCubeLoader() override;

    /// @param cache  a TextureCubeCache.
    SharedPtr<TextureCube> load(AssetCache<TextureCube>& cache, const char* name) override;
    bool isKnown(const char* name) override;
};

} // namespace orv
