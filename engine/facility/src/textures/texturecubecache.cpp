#include "orv/texturecubecache.h"

#include <string>

namespace orv
{

namespace
{

std::string joinNames(const char* const (&names)[TextureCube::FACE_COUNT])
{
    std::string joined;
    for (const char* name : names)
    {
        joined += name ? name : "";
        joined += ';';
    }
    joined.pop_back();
    return joined;
}

} // namespace

TextureCubeCache::TextureCubeCache() = default;

TextureCubeCache::~TextureCubeCache() = default;

SharedPtr<TextureCube> TextureCubeCache::create(unsigned width, unsigned height, Texture::Format format,
                                                Texture::Type type, const char* name)
{
    const auto resource = makeShared<detail::TextureResource>();
    auto cube = detail::makeTextureCube(*this, width, height, format, type, resource);
    if (cube)
        add(cube, name);
    return cube;
}

SharedPtr<TextureCube> detail::makeTextureCube(TextureCubeCache& cache, unsigned width, unsigned height,
                                               Texture::Format format, Texture::Type type,
                                               const SharedPtr<TextureResource>& resource)
{
    cache.getResourceCache()->add(resource);
    if (!resource || !resource->allocate())
        return {};
    return makeShared<TextureCube>(width, height, format, type, resource);
}

bool exists(TextureCubeCache& cache, const char* positiveX, const char* negativeX, const char* positiveY,
            const char* negativeY, const char* positiveZ, const char* negativeZ)
{
    return cache.exists(
        joinNames({positiveX, negativeX, positiveY, negativeY, positiveZ, negativeZ}).c_str());
}

SharedPtr<TextureCube> get(TextureCubeCache& cache, const char* positiveX, const char* negativeX,
                           const char* positiveY, const char* negativeY, const char* positiveZ,
                           const char* negativeZ)
{
    return cache.get(joinNames({positiveX, negativeX, positiveY, negativeY, positiveZ, negativeZ}).c_str());
}

} // namespace orv
