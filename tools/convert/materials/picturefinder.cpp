#include "picturefinder.h"

#include "convert/files/datauri.h"
#include "convert/files/modelfiles.h"
#include "convert/lowercase.h"
#include "pictures.h"

#include <assimp/scene.h>

#include <filesystem>

namespace convert
{

namespace fs = std::filesystem;

namespace
{

constexpr uint64_t LARGEST_FILE = 512u << 20;

bool startsWith(const std::string& text, const char* start)
{
    return text.rfind(start, 0) == 0;
}

std::string lastPart(const std::string& path)
{
    return path.substr(path.find_last_of("/\\") + 1);
}

/// The model holds it as a file, or as bare pixels.
FoundPicture readEmbedded(const std::string& path, const aiTexture& texture)
{
    FoundPicture found;
    found.isThere = true;
    const bool isNumber = startsWith(path, "*"); // the number may be the only name
    const std::string name = isNumber ? texture.mFilename.C_Str() : path;
    found.name = fs::path(lastPart(name)).stem().string();
    if (found.name.empty() || found.name[0] == '*')
        found.name = "texture" + (isNumber ? path.substr(1) : std::string());
    if (texture.mHeight == 0)
    {
        const uint8_t* data = reinterpret_cast<const uint8_t*>(texture.pcData);
        found.bytes.assign(data, data + texture.mWidth);
        return found;
    }
    DecodedPicture pixels{int(texture.mWidth), int(texture.mHeight), 4, {}};
    for (size_t i = 0; i < pixels.getPixelCount(); ++i)
    {
        const aiTexel& texel = texture.pcData[i];
        pixels.data.insert(pixels.data.end(), {texel.r, texel.g, texel.b, texel.a});
    }
    found.bytes = encodePng(pixels);
    return found;
}

} // namespace

PictureFinder::PictureFinder(const aiScene& scene, ModelFiles& files) : m_scene(scene), m_files(files) {}

FoundPicture PictureFinder::find(const std::string& path) const
{
    if (const aiTexture* embedded = m_scene.GetEmbeddedTexture(path.c_str()))
        return readEmbedded(path, *embedded);
    if (!isDataUri(path))
        return findOnDisk(path);
    std::optional<std::vector<uint8_t>> bytes = readDataUri(path);
    return {"texture", bytes ? std::move(*bytes) : std::vector<uint8_t>(), bytes.has_value()};
}

/// By the path from the model's folder, or else by its file name, ignoring case: paths of other machines are common.
FoundPicture PictureFinder::findOnDisk(const std::string& path) const
{
    const std::string name = lastPart(toPath(path));
    FoundPicture found{fs::path(name).stem().string(), {}, false};
    found.isThere = m_files.readNamed(path, found.bytes, LARGEST_FILE);
    for (const char* folder : {"", "textures/", "../textures/"})
    {
        const std::string other = m_files.getFolder() + folder;
        found.isThere = found.isThere || m_files.read(other + name, found.bytes, LARGEST_FILE) ||
                        readOthersCase(other, found, name);
    }
    return found;
}

/// A file of the folder with the name, ignoring case.
bool PictureFinder::readOthersCase(const std::string& folder, FoundPicture& found,
                                   const std::string& name) const
{
    for (const std::string& other : m_files.list(folder.empty() ? "." : folder))
    {
        if (toLowerCase(other) == toLowerCase(name) &&
            m_files.read(folder + other, found.bytes, LARGEST_FILE))
            return true;
    }
    return false;
}

} // namespace convert
