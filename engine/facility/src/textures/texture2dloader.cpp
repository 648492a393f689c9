#include "orv/texture2dloader.h"

#include "imagesuffix.h"
#include "orv/detail/loadscope.h"
#include "orv/image.h"
#include "orv/log.h"
#include "orv/stream.h"
#include "orv/textsuffix.h"
#include "orv/texture2dcache.h"

namespace orv
{

Texture2DLoader::~Texture2DLoader() = default;

bool Texture2DLoader::isKnown(const char* name)
{
    return detail::hasImageSuffix(name);
}

SharedPtr<Texture2D> Texture2DLoader::load(AssetCache<Texture2D>& cache, const char* name)
{
    const detail::LoadScope scope(name);
    const std::string normalized = detail::normalizeAssetName(name);
    const SharedPtr<Stream> stream = cache.getStream(normalized.c_str());
    if (!stream)
        return {};

    const Image image(*stream);
    if (!image.data())
    {
        // Another loader reads these files and has its own messages.
        if (!endsWith(normalized.c_str(), ".pvr"))
            ORV_LOG_ERROR("Image failed to load texture \"%s\"", normalized.c_str());
        return {};
    }
    const int channels = image.channelCount();
    if (channels < 1 || channels > 4)
    {
        ORV_LOG_ERROR("Invalid bits per pixel, %d, in \"%s\" (can be 8, 16, 24 or 32).", channels * 8,
                      normalized.c_str());
        return {};
    }
    return static_cast<Texture2DCache&>(cache).create(
        unsigned(image.width()), unsigned(image.height()), Texture::getFormat(channels),
        Texture::Type::UNSIGNED_BYTE, image.data(), normalized.c_str());
}

} // namespace orv
