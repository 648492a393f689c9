#include "orv/texturepropertyutil.h"

#include "orv/appearance.h"
#include "orv/assetcachepool.h"
#include "orv/textsuffix.h"
#include "orv/texture2dcache.h"
#include "orv/texturecubecache.h"

#include <string>

namespace orv
{

namespace
{

void set2D(AssetCachePool& pool, Appearance& appearance, const char* propertyName, const char* builtIn)
{
    const SharedPtr<Texture2D> texture2d = pool.getTexture2DCache()->get(builtIn);
    ORV_ASSERT(texture2d);
    appearance.setProperty(propertyName, texture2d);
}

SharedPtr<Texture2D> find2D(Texture2DCache& cache, const std::string& name)
{
    if (!endsWith(name.c_str(), ".pvr"))
    {
        // The same picture compressed for the GPU, if there is one.
        if (SharedPtr<Texture2D> texture = cache.get((name.substr(0, name.rfind('.')) + ".pvr").c_str()))
            return texture;
    }
    return cache.get(name.c_str());
}

} // namespace

bool applyTextureProperty(AssetCachePool& pool, Appearance& appearance, const char* propertyName,
                          unsigned samplerKind, const char* textureName, bool whiteWhenEmpty)
{
    const std::string name = textureName ? textureName : "";
    if (name.empty())
    {
        if (whiteWhenEmpty)
            set2D(pool, appearance, propertyName, "orv#white.png");
        return false;
    }

    if (samplerKind == SAMPLER_KIND_2D)
    {
        if (const SharedPtr<Texture2D> texture = find2D(*pool.getTexture2DCache(), name))
            return appearance.setProperty(propertyName, texture);
        ORV_LOG_ERROR("Failed to find 2d texture \"%s\"; using \"missing\" texture.", name.c_str());
        pool.explainMissing(name.c_str());
    }
    else if (samplerKind == SAMPLER_KIND_CUBE)
    {
        if (const SharedPtr<TextureCube> texture = pool.getTextureCubeCache()->get(name.c_str()))
            return appearance.setProperty(propertyName, texture);
        ORV_LOG_ERROR("Failed to find cube texture \"%s\"; using \"missing\" texture.", name.c_str());
    }
    else
    {
        ORV_LOG_ERROR("Unsupported sampler type; using \"missing\" texture.");
    }
    set2D(pool, appearance, propertyName, "orv#missing.png");
    return false;
}

} // namespace orv
