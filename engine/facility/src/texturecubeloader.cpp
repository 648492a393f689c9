#include "orv/texturecubeloader.h"

#include "imagesuffix.h"
#include "orv/detail/loadscope.h"
#include "orv/image.h"
#include "orv/log.h"
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

/// Indexed by TextureCube::Face.
using Faces = std::array<SharedPtr<Image>, TextureCube::FACE_COUNT>;

SharedPtr<Image> loadImage(AssetCache<TextureCube>& cache, const char* name)
{
    const SharedPtr<Stream> stream = cache.getStream(name);
    if (!stream)
    {
        ORV_LOG_ERROR("TextureCube image \"%s\" not found.", name);
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

bool loadGrid(AssetCache<TextureCube>& cache, const char* name, Faces& faces)
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
        SharedPtr<Image>& face = faces[std::size_t(GRID_FACES[cell])];
        face = Image::crop(*image, x, y, width, height);
        if (!face)
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

bool loadSix(AssetCache<TextureCube>& cache, const std::string& name, Faces& faces)
{
    std::array<std::string, TextureCube::FACE_COUNT> names;
    if (!splitNames(name, names))
    {
        ORV_LOG_ERROR("TextureCube name is invalid: %s", name.c_str());
        return false;
    }
    for (std::size_t i = 0; i < names.size(); ++i)
    {
        faces[i] = loadImage(cache, detail::normalizeAssetName(names[i].c_str()).c_str());
        if (!faces[i])
            return false;
        if (faces[i]->width() != faces[0]->width() || faces[i]->height() != faces[0]->height())
        {
            ORV_LOG_ERROR("TextureCube images must have matching dimensions.");
            return false;
        }
        // GL wants one format for all faces, or the cube is incomplete and black.
        if (faces[i]->channelCount() != faces[0]->channelCount())
        {
            ORV_LOG_ERROR("TextureCube image \"%s\" has %d channels, the first one %d.", names[i].c_str(),
                          faces[i]->channelCount(), faces[0]->channelCount());
            return false;
        }
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
    Faces faces;
    if (!(isGrid ? loadGrid(cache, normalized.c_str(), faces) : loadSix(cache, normalized, faces)))
        return {};

    const auto width = unsigned(faces[0]->width());
    const auto height = unsigned(faces[0]->height());
    if (!detail::requireSquareFaces(width, height))
        return {};
    const SharedPtr<TextureCube> cube = static_cast<TextureCubeCache&>(cache).create(
        width, height, Texture::getFormat(faces[0]->channelCount()), Texture::Type::UNSIGNED_BYTE,
        normalized.c_str());
    if (!cube)
        return {};
    for (std::size_t i = 0; i < faces.size(); ++i)
        cube->setFace(TextureCube::Face(i), faces[i]->data());
    return cube->isComplete() ? cube : SharedPtr<TextureCube>();
}

} // namespace orv
