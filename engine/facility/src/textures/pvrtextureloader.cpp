#include "orv/pvrtextureloader.h"

#include "orv/detail/loadscope.h"
#include "orv/filetostring.h"
#include "orv/log.h"
#include "orv/stream.h"
#include "orv/textsuffix.h"
#include "orv/texture2dcache.h"
#include "pvr/pvrfile.h"
#include "pvrtexture.h"

namespace orv
{

PvrTextureLoader::~PvrTextureLoader() = default;

bool PvrTextureLoader::isKnown(const char* name)
{
    return endsWith(name, ".pvr");
}

SharedPtr<Texture2D> PvrTextureLoader::load(AssetCache<Texture2D>& cache, const char* name)
{
    const detail::LoadScope scope(name);
    const std::string normalized = detail::normalizeAssetName(name);
    const SharedPtr<Stream> stream = cache.getStream(normalized.c_str());
    if (!stream)
        return {};
    const FileToString file(*stream);
    if (!file.getStart())
    {
        ORV_LOG_ERROR("Failed to allocate memory for file!");
        return {};
    }

    const auto* data = reinterpret_cast<const uint8_t*>(file.getStart());
    const auto size = size_t(file.getEnd() - file.getStart());
    if (!isKnown(normalized.c_str()) && !pvr::isPvr(data, size))
        return {}; // the other loader has logged why it failed

    detail::PvrTexture texture;
    std::string error;
    if (!detail::uploadPvr(data, size, texture, error))
    {
        ORV_LOG_ERROR("PVR texture \"%s\" failed to load: %s.", normalized.c_str(), error.c_str());
        return {};
    }
    if (texture.hasUnusedMipmaps)
        ORV_LOG_WARN(
            "Mipmaps of PVR texture \"%s\" are not used: they end above one pixel, or its size (%u x "
            "%u) is not a power of two.",
            normalized.c_str(), texture.width, texture.height);
    return static_cast<Texture2DCache&>(cache).create(
        texture.width, texture.height, float(texture.bitsPerPixel) / 8.0f, texture.mipmapCount != 0,
        texture.glName, normalized.c_str());
}

} // namespace orv
