#pragma once

#include "orv/export.h"

namespace orv
{

class Appearance;
class AssetCachePool;

/// Kinds of sampler in scene files.
constexpr unsigned SAMPLER_KIND_2D = 0;
constexpr unsigned SAMPLER_KIND_CUBE = 1;

/// Sets element 0 of a texture property from an asset name.
///
/// A 2D texture is looked for under its name with the suffix replaced by ".pvr" first, then as given. What cannot
/// be found, or has a kind other than the two, is logged and becomes the 2D texture "orv#missing.png".
/// @param textureName    null counts as empty.
/// @param whiteWhenEmpty what an empty name means: the texture "orv#white.png", or nothing at all.
/// @return whether the named texture was found.
ORV_API bool applyTextureProperty(AssetCachePool& pool, Appearance& appearance, const char* propertyName,
                                  unsigned samplerKind, const char* textureName, bool whiteWhenEmpty);

} // namespace orv
