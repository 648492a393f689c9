#include "textures.h"

#include "convert/files/datauri.h"

#include <assimp/texture.h>

#include <algorithm>
#include <cstring>

namespace convert::gltf
{

namespace
{

std::string lastPart(const std::string& path)
{
    return path.substr(path.find_last_of("/\\") + 1);
}

std::unique_ptr<aiTexture> makeTexture(Span bytes)
{
    auto texture = std::make_unique<aiTexture>();
    texture->mWidth = unsigned(bytes.size());
    texture->mHeight = 0; // 0: a file's bytes, not pixels
    texture->pcData = new aiTexel[(bytes.size() + sizeof(aiTexel) - 1) / sizeof(aiTexel)];
    std::memcpy(texture->pcData, bytes.data(), bytes.size());
    return texture;
}

} // namespace

Textures::Textures(Source& source) : m_source(source)
{
    const Object root = source.document.root();
    for (size_t i = 0; i < root.length("images"); ++i)
    {
        const std::string uri = root.at("images", i).text("uri");
        if (!uri.empty() && !isDataUri(uri))
            m_fileNames.push_back(lastPart(uri));
    }
}

Textures::~Textures() = default;

/// A picture in an extension's format may have a fallback in a common format.
std::optional<size_t> Textures::chooseImage(const Object& texture)
{
    const std::optional<size_t> webp = texture.extension("EXT_texture_webp").index("source");
    if (webp)
        return webp;
    const std::optional<size_t> usual = texture.index("source");
    if (usual)
        return usual;
    const Object basis = texture.extension("KHR_texture_basisu");
    const std::string format = basis ? "Basis Universal (KHR_texture_basisu)" : "an extension's format";
    const std::string name =
        basis.has("source") ? getName(m_source.document.find("images", basis, "source")) : texture.place();
    m_source.report.lose("texture-unreadable", "texture \"" + name + "\", which is in " + format + " alone");
    return std::nullopt;
}

std::string Textures::getPath(const Object& texture)
{
    const std::optional<size_t> index = chooseImage(texture);
    if (!index)
        return {};
    const auto known = m_paths.find(*index);
    if (known != m_paths.end())
        return known->second;
    return m_paths[*index] = addImage(m_source.document.get("images", *index, texture));
}

std::string Textures::addImage(const Object& image)
{
    try
    {
        const std::optional<size_t> view = image.index("bufferView");
        if (view)
            return embed(image, m_source.buffers.view(*view, image));
        const std::string uri = image.text("uri");
        if (!isDataUri(uri))
            return addFile(image, uri);
        const std::optional<Bytes> bytes = readDataUri(uri);
        return embed(image, bytes ? Span(*bytes) : Span());
    }
    catch (const Fault& fault) // the model is converted without this picture
    {
        m_source.report.lose("texture-missing", "texture \"" + getName(image) + "\": " + fault.what());
        return {};
    }
}

std::string Textures::addFile(const Object& image, const std::string& uri)
{
    constexpr size_t LONGEST = 1000; // of libassimp's strings
    if (uri.empty())
        image.fail("has neither a uri nor a bufferView");
    if (uri.size() > LONGEST || uri.find('\0') != std::string::npos)
        image.fail("uri", "is no path");
    return uri;
}

std::string Textures::embed(const Object& image, Span bytes)
{
    if (bytes.empty() || bytes.size() > UINT32_MAX)
        image.fail("holds no picture");
    const std::string path = "*" + std::to_string(m_embedded.size());
    m_embedded.push_back(makeTexture(bytes));
    // libassimp would use an embedded picture for every file of its name.
    const std::string name = lastPart(image.text("name"));
    const bool isFree = std::find(m_fileNames.begin(), m_fileNames.end(), name) == m_fileNames.end();
    m_embedded.back()->mFilename = aiString(isFree ? name.substr(0, name.find('\0')).substr(0, 200) : "");
    return path;
}

std::vector<std::unique_ptr<aiTexture>> Textures::take()
{
    return std::move(m_embedded);
}

} // namespace convert::gltf
