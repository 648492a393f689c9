#include "picturefinder.h"

#include "lowercase.h"
#include "pictures.h"

#include <assimp/scene.h>

#include <algorithm>
#include <cctype>
#include <fstream>

namespace convert
{

namespace fs = std::filesystem;

namespace
{

constexpr uintmax_t LARGEST_FILE = 512u << 20;

bool startsWith(const std::string& text, const char* start)
{
    return text.rfind(start, 0) == 0;
}

std::string lastPart(const std::string& path)
{
    return path.substr(path.find_last_of("/\\") + 1);
}

/// "%20" and the like.
std::string decodeUrl(const std::string& text)
{
    std::string decoded;
    for (size_t i = 0; i < text.size(); ++i)
    {
        const bool coded = text[i] == '%' && i + 2 < text.size() &&
                           std::isxdigit(static_cast<unsigned char>(text[i + 1])) &&
                           std::isxdigit(static_cast<unsigned char>(text[i + 2]));
        decoded += coded ? char(std::stoi(text.substr(i + 1, 2), nullptr, 16)) : text[i];
        i += coded ? 2 : 0;
    }
    return decoded;
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

/// Files in the folder that have the name if one does not look at the case of letters.
void addOthersCase(const fs::path& folder, const std::string& name, std::vector<fs::path>& candidates)
{
    std::error_code ignored;
    std::vector<fs::path> found;
    for (const fs::directory_entry& entry : fs::directory_iterator(folder, ignored))
    {
        if (toLowerCase(entry.path().filename().string()) == toLowerCase(name))
            found.push_back(entry.path());
    }
    std::sort(found.begin(), found.end()); // a folder has no order of its own
    candidates.insert(candidates.end(), found.begin(), found.end());
}

} // namespace

PictureFinder::PictureFinder(const aiScene& scene, const fs::path& model)
    : m_scene(scene)
    , m_folder(model.has_parent_path() ? model.parent_path() : ".")
{
}

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
    std::string plain = decodeUrl(path);
    if (startsWith(plain, "file://"))
        plain.erase(0, 7);
    std::replace(plain.begin(), plain.end(), '\\', '/');
    const std::string name = lastPart(plain);
    std::vector<fs::path> candidates = {m_folder / path, m_folder / plain, m_folder / name};
    for (const char* folder : {"", "textures", "../textures"})
        addOthersCase(m_folder / folder, name, candidates);

    FoundPicture found{fs::path(name).stem().string(), {}, false};
    for (const fs::path& candidate : candidates)
    {
        std::error_code ignored;
        if (!fs::is_regular_file(candidate, ignored) || fs::file_size(candidate, ignored) > LARGEST_FILE)
            continue;
        std::ifstream file(candidate, std::ios::binary);
        found.bytes.resize(fs::file_size(candidate, ignored));
        file.read(reinterpret_cast<char*>(found.bytes.data()), std::streamsize(found.bytes.size()));
        found.isThere = file.good();
        break;
    }
    return found;
}

} // namespace convert
