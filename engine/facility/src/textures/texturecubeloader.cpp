#include "orv/texturecubeloader.h"

#include "imagesuffix.h"
#include "orv/detail/loadscope.h"
#include "orv/image.h"
#include "orv/log.h"
#include "orv/renderdevice.h"
#include "orv/stream.h"
#include "orv/texturecubecache.h"

#include <array>
#include <cctype>
#include <string>

namespace orv
{

namespace
{

const int GRID_COLUMNS = 3;
const int GRID_ROWS = 2;

/// The face in each cell of the grid, row by row from the top left.
const TextureCube::Face GRID_FACES[TextureCube::FACE_COUNT] = {
    TextureCube::Face::NEGATIVE_X, TextureCube::Face::NEGATIVE_Z, TextureCube::Face::POSITIVE_X,
    TextureCube::Face::NEGATIVE_Y, TextureCube::Face::POSITIVE_Y, TextureCube::Face::POSITIVE_Z};

/// Uploads a cube's faces one after the other, so that only one picture is in memory.
class CubeMaker
{
public:
    explicit CubeMaker(TextureCubeCache& cache) : m_cache(cache) {}

    /// Deletes the GL name of an incomplete cube.
    ~CubeMaker()
    {
        if (!m_resource || m_isFinished)
            return;
        m_resource->deallocate();
        RenderDevice::getError(false); // clears the error of a refused face
    }

    /// @param name  of the picture, for messages.
    bool addFace(TextureCube::Face face, const Image& image, const char* name)
    {
        if (!m_cube && !begin(image))
            return false;
        if (image.width() != m_width || image.height() != m_height)
        {
            ORV_LOG_ERROR("TextureCube images must have matching dimensions.");
            return false;
        }
        // GL needs one format for all faces, or the cube is incomplete and black.
        if (image.channelCount() != m_channels)
        {
            ORV_LOG_ERROR("TextureCube image \"%s\" has %d channels, the first one %d.", name,
                          image.channelCount(), m_channels);
            return false;
        }
        m_cube->setFace(face, image.data());
        return true;
    }

    SharedPtr<TextureCube> finish(const char* name)
    {
        if (!m_cube || !m_cube->isComplete())
            return {};
        m_isFinished = true;
        m_cache.add(m_cube, name);
        return m_cube;
    }

private:
    bool begin(const Image& image)
    {
        m_width = image.width();
        m_height = image.height();
        m_channels = image.channelCount();
        if (!detail::requireSquareFaces(unsigned(m_width), unsigned(m_height)))
            return false;
        m_resource = makeShared<detail::TextureResource>();
        m_cube =
            detail::makeTextureCube(m_cache, unsigned(m_width), unsigned(m_height),
                                    Texture::getFormat(m_channels), Texture::Type::UNSIGNED_BYTE, m_resource);
        return bool(m_cube);
    }

    TextureCubeCache& m_cache;
    SharedPtr<detail::TextureResource> m_resource;
    SharedPtr<TextureCube> m_cube;
    int m_width = 0;
    int m_height = 0;
    int m_channels = 0;
    bool m_isFinished = false;
};

SharedPtr<Image> loadImage(AssetCache<TextureCube>& cache, const char* name)
{
    const SharedPtr<Stream> stream = cache.getStream(name);
    if (!stream)
    {
        ORV_LOG_ERROR("TextureCube image \"%s\" not found.", name);
        cache.getAssetPath()->explainMissing(name);
        return {};
    }
    auto image = makeShared<Image>(*stream);
    if (!image || !image->data())
    {
        ORV_LOG_ERROR("TextureCube image \"%s\" failed to load.", name);
        return {};
    }
    return image;
}

uint64_t countBytes(const Image& image)
{
    return uint64_t(image.width()) * uint64_t(image.height()) * uint64_t(image.channelCount());
}

bool loadGrid(AssetCache<TextureCube>& cache, const char* name, CubeMaker& maker)
{
    const SharedPtr<Image> image = loadImage(cache, name);
    if (!image)
        return false;
    if (image->width() % GRID_COLUMNS != 0)
    {
        ORV_LOG_ERROR("Cube map \"%s\" width must be divisible by %d.", name, GRID_COLUMNS);
        return false;
    }
    if (image->height() % GRID_ROWS != 0)
    {
        ORV_LOG_ERROR("Cube map \"%s\" height must be divisible by %d.", name, GRID_ROWS);
        return false;
    }

    const int width = image->width() / GRID_COLUMNS;
    const int height = image->height() / GRID_ROWS;
    for (int cell = 0; cell < TextureCube::FACE_COUNT; ++cell)
    {
        const int x = cell % GRID_COLUMNS * width;
        const int y = cell / GRID_COLUMNS * height;
        const SharedPtr<Image> face = Image::crop(*image, x, y, width, height);
        if (!face || !maker.addFace(GRID_FACES[cell], *face, name))
            return false;
    }
    return true;
}

std::string trimmed(const std::string& text)
{
    std::size_t begin = 0;
    std::size_t end = text.size();
    while (begin < end && std::isspace(static_cast<unsigned char>(text[begin])))
        ++begin;
    while (end > begin && std::isspace(static_cast<unsigned char>(text[end - 1])))
        --end;
    return text.substr(begin, end - begin);
}

bool splitNames(const std::string& name, std::array<std::string, TextureCube::FACE_COUNT>& names)
{
    std::size_t begin = 0;
    for (std::size_t i = 0; i < names.size(); ++i)
    {
        const std::size_t end = name.find(';', begin);
        const bool isLast = i + 1 == names.size();
        if ((end == std::string::npos) != isLast)
            return false;
        names[i] = trimmed(name.substr(begin, isLast ? std::string::npos : end - begin));
        if (names[i].empty())
            return false;
        begin = end + 1;
    }
    return true;
}

bool loadSix(AssetCache<TextureCube>& cache, const std::string& name, CubeMaker& maker)
{
    std::array<std::string, TextureCube::FACE_COUNT> names;
    if (!splitNames(name, names))
    {
        ORV_LOG_ERROR("TextureCube name is invalid: %s", name.c_str());
        return false;
    }
    SharedPtr<Image> image;
    for (std::size_t i = 0; i < names.size(); ++i)
    {
        const bool isSame = i > 0 && names[i] == names[i - 1];
        if (!isSame)
        {
            image.reset(); // frees it before the next one
            image = loadImage(cache, detail::normalizeAssetName(names[i].c_str()).c_str());
        }
        else if (!detail::LoadScope::takeTexture(countBytes(*image))) // GL stores each face
        {
            return false;
        }
        if (!image || !maker.addFace(TextureCube::Face(i), *image, names[i].c_str()))
            return false;
    }
    return true;
}

} // namespace

TextureCubeLoader::~TextureCubeLoader() = default;

bool TextureCubeLoader::isKnown(const char* name)
{
    return detail::hasImageSuffix(name);
}

SharedPtr<TextureCube> TextureCubeLoader::load(AssetCache<TextureCube>& cache, const char* name)
{
    const detail::LoadScope scope(name);
    const std::string normalized = detail::normalizeAssetName(name);
    const bool isGrid = normalized.find(';') == std::string::npos;
    CubeMaker maker(static_cast<TextureCubeCache&>(cache));
    if (!(isGrid ? loadGrid(cache, normalized.c_str(), maker) : loadSix(cache, normalized, maker)))
        return {};
    return maker.finish(normalized.c_str());
}

} // namespace orv
