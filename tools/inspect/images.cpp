#include "images.h"

#include "orv/detail/assetpath.h"
#include "orv/filestreamsource.h"
#include "orv/image.h"
#include "orv/memfilesource.h"
#include "orv/textsuffix.h"

namespace inspect
{

namespace
{

constexpr unsigned PVR_HEADER = 52;

bool isPowerOfTwo(unsigned value)
{
    return value != 0 && (value & (value - 1)) == 0;
}

/// Of all levels down to a single pixel, or only of the first.
unsigned countPixels(unsigned width, unsigned height, bool mipmaps)
{
    unsigned pixels = width * height;
    while (mipmaps && (width > 1 || height > 1))
    {
        width = width > 1 ? width / 2 : 1;
        height = height > 1 ? height / 2 : 1;
        pixels += width * height;
    }
    return pixels;
}

} // namespace

bool ImageSize::isPowerOfTwo() const
{
    return inspect::isPowerOfTwo(width) && inspect::isPowerOfTwo(height);
}

Images::Images(const std::filesystem::path& folder)
    : m_folder(folder.empty() ? "." : folder)
    , m_builtIn{orv::create_memfilesource_orv(), orv::create_memfilesource_luvane()}
{
}

const ImageSize& Images::measure(const std::string& name, bool cube)
{
    const auto known = m_known.find({name, cube});
    if (known != m_known.end())
        return known->second;

    ImageSize size;
    if (!cube && !orv::endsWith(name.c_str(), ".pvr")) // the engine prefers a .pvr of the same name
        size = measureFile(name.substr(0, name.rfind('.')) + ".pvr", cube);
    if (size.state == ImageState::MISSING)
        size = measureFile(name, cube);
    return m_known[{name, cube}] = size;
}

ImageSize Images::measureFile(const std::string& name, bool cube) const
{
    ImageSize size;
    const std::string normalised = orv::detail::normalizeAssetName(name.substr(0, name.find(';')).c_str());
    orv::FileStreamSource folder(m_folder.c_str());
    orv::SharedPtr<orv::Stream> stream;
    for (const auto& source : m_builtIn)
    {
        if (source->exists(normalised.c_str()))
            stream = source->open(normalised.c_str(), false);
    }
    size.isBuiltIn = bool(stream);
    if (!stream && folder.exists(normalised.c_str()))
        stream = folder.open(normalised.c_str(), false);
    if (!stream)
        return size;
    if (orv::endsWith(normalised.c_str(), ".pvr"))
    {
        const unsigned bytes = unsigned(stream->size());
        size.state = bytes > PVR_HEADER ? ImageState::READABLE : ImageState::UNREADABLE;
        size.width = size.height = 1; // irrelevant: a compressed picture has its own mipmaps
        size.gpuBytes = bytes > PVR_HEADER ? bytes - PVR_HEADER : 0;
        return size;
    }
    const orv::Image image(*stream);
    size.state = image.data() ? ImageState::READABLE : ImageState::UNREADABLE;
    const bool isGrid = cube && name.find(';') == std::string::npos;
    size.width = unsigned(image.width()) / (isGrid ? 3 : 1);
    size.height = unsigned(image.height()) / (isGrid ? 2 : 1);
    size.gpuBytes = countPixels(size.width, size.height, size.isPowerOfTwo()) *
                    unsigned(image.channelCount()) * (cube ? 6 : 1);
    return size;
}

} // namespace inspect
