#include "picturefinder.h"

#include "lowercase.h"
#include "modelfiles.h"
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

std::vector<uint8_t> decodeBase64(const std::string& text)
{
    const std::string digits = "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789+/";
    std::vector<uint8_t> bytes;
    uint32_t bits = 0;
    int count = 0;
    for (const char c : text)
    {
        const size_t digit = digits.find(c);
        if (digit == std::string::npos)
            continue; // padding, line ends
        bits = bits << 6 | uint32_t(digit);
        count += 6;
        if (count >= 8)
        {
            count -= 8;
            bytes.push_back(uint8_t(bits >> count));
        }
    }
    return bytes;
}

/// Such as "data:image/png;base64,iVBOR...".
FoundPicture readDataUri(const std::string& uri)
{
    const size_t comma = uri.find(',');
    const std::string head = toLowerCase(uri.substr(0, comma));
    FoundPicture found{"texture", {}, false};
    if (comma == std::string::npos || head.find(";base64") == std::string::npos)
        return found;
    found.bytes = decodeBase64(decodeUrl(uri.substr(comma + 1)));
    found.isThere = true;
    return found;
}

/// The model holds it as a file, or as bare pixels.
FoundPicture readEmbedded(const std::string& path, const aiTexture& texture)
{
    FoundPicture found;
    found.isThere = true;
    const bool isNumber = startsWith(path, "*"); // there may be no other name
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
    Picture pixels{int(texture.mWidth), int(texture.mHeight), 4, {}};
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
    return startsWith(path, "data:") ? readDataUri(path) : findOnDisk(path);
}

/// Where the path leads from the model's folder, or else where its last part does: paths of other machines and
/// other cases of letters are common.
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

/// A file of the folder that has the name if one does not look at the case of letters.
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
