#include "reader.h"

#include "scenereader.h"

#include "convert/lowercase.h"

#include <assimp/scene.h>

#include <algorithm>
#include <filesystem>

namespace convert::gltf
{

namespace
{

bool beginsLikeJson(Span bytes)
{
    for (const uint8_t byte : bytes)
    {
        const bool isSkipped = byte == ' ' || byte == '\n' || byte == '\r' || byte == '\t' || byte >= 0x80;
        if (!isSkipped)
            return byte == '{';
    }
    return false;
}

bool isBinary(Span bytes)
{
    const std::string mark = "glTF";
    return bytes.size() >= mark.size() && std::equal(mark.begin(), mark.end(), bytes.begin());
}

bool isNamedGltf(const std::string& path)
{
    const std::string extension = toLowerCase(std::filesystem::path(path).extension().string());
    return extension == ".gltf" || extension == ".glb" || extension == ".vrm";
}

bool isFirstBinary(Span bytes)
{
    return isBinary(bytes) && bytes.size() >= 8 && bytes[4] == 1 && bytes[5] + bytes[6] + bytes[7] == 0;
}

} // namespace

bool mayBeGltf(Span start, const std::string& path, bool isOthers)
{
    return isBinary(start) || isNamedGltf(path) || (!isOthers && beginsLikeJson(start));
}

Opened openGltf(Bytes file, const std::string& path)
{
    if (isFirstBinary(file))
        return {Opened::Kind::FIRST, nullptr};
    const bool isSure = isBinary(file) || isNamedGltf(path);
    std::unique_ptr<Document> document;
    try
    {
        document = std::make_unique<Document>(std::move(file));
    }
    catch (const Fault&)
    {
        if (isSure)
            throw;
        return {};
    }
    const Object asset = document->root().object("asset");
    if (!asset && !isSure)
        return {};
    const bool isFirst = asset.word("version").substr(0, 1) == "1";
    return {isFirst ? Opened::Kind::FIRST : Opened::Kind::SECOND, std::move(document)};
}

std::unique_ptr<aiScene> readGltf(std::unique_ptr<Document> document, FileOpener open, const Options& options,
                                  Report& report)
{
    Source source(std::move(document), std::move(open), options, report);
    const Object asset = source.document.root().object("asset");
    const bool saysLeast = asset.has("minVersion"); // without it, minor versions are compatible
    const std::string wanted = asset.word(saysLeast ? "minVersion" : "version");
    if (wanted.empty())
        throw Fault("does not say which version of glTF it is");
    const bool isRead = wanted == "2" || (saysLeast ? wanted == "2.0" : wanted.compare(0, 2, "2.") == 0);
    if (!isRead)
        throw Fault("is of glTF " + wanted.substr(0, 20) + ", which is not read");
    return readScene(source);
}

} // namespace convert::gltf
