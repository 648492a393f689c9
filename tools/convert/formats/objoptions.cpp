#include "objoptions.h"

#include "convert/files/modelfiles.h"
#include "convert/lowercase.h"
#include "convert/materials/materials.h"
#include "convert/report.h"

#include <assimp/scene.h>

#include <map>
#include <sstream>
#include <string_view>
#include <vector>

namespace convert
{

namespace
{

/// A texture transform: coordinates are scaled, then moved.
struct MapOptions
{
    aiVector2D scale{1.0f, 1.0f};
    aiVector2D offset{0.0f, 0.0f};
    std::string file; ///< if there are options: libassimp reads the name as a missing number

    bool operator==(const MapOptions& other) const { return scale == other.scale && offset == other.offset; }
};

/// By kind of picture.
using Maps = std::map<aiTextureType, MapOptions>;

aiTextureType getKind(const std::string& statement)
{
    const struct
    {
        const char* statement;
        aiTextureType kind;
    } kinds[] = {{"map_kd", aiTextureType_DIFFUSE},  {"map_ks", aiTextureType_SPECULAR},
                 {"map_ke", aiTextureType_EMISSIVE}, {"map_emissive", aiTextureType_EMISSIVE},
                 {"map_bump", aiTextureType_HEIGHT}, {"bump", aiTextureType_HEIGHT},
                 {"map_kn", aiTextureType_NORMALS},  {"norm", aiTextureType_NORMALS},
                 {"map_d", aiTextureType_OPACITY},   {"map_ns", aiTextureType_SHININESS}};
    for (const auto& kind : kinds)
    {
        if (toLowerCase(statement) == kind.statement)
            return kind.kind;
    }
    return aiTextureType_NONE;
}

/// One to three numbers, of which the first two are used; missing ones keep their value.
void readPair(std::istream& words, aiVector2D& pair)
{
    float values[3];
    int count = 0;
    for (std::streampos at = words.tellg(); count < 3; at = words.tellg())
    {
        if (words >> values[count])
        {
            ++count;
            continue;
        }
        words.clear();
        words.seekg(at);
        break;
    }
    pair.x = count > 0 ? values[0] : pair.x;
    pair.y = count > 1 ? values[1] : pair.y;
}

std::string readRest(std::istream& words)
{
    std::string rest;
    std::getline(words >> std::ws, rest);
    rest.erase(rest.find_last_not_of(" \t\r") + 1);
    return rest;
}

MapOptions readOptions(std::istream& words)
{
    MapOptions options;
    aiVector2D ignored;
    bool hasOptions = false;
    for (; (words >> std::ws).peek() == '-'; hasOptions = true)
    {
        std::string option;
        std::string value;
        words >> option;
        if (option == "-s" || option == "-o" || option == "-t")
            readPair(words, option == "-s" ? options.scale : option == "-o" ? options.offset : ignored);
        else
            words >> value;
        if (option == "-mm") // which has two numbers
            words >> value;
    }
    words.clear(); // of the line's end
    options.file = hasOptions ? readRest(words) : "";
    return options;
}

std::string_view toText(const std::vector<uint8_t>& bytes)
{
    return {reinterpret_cast<const char*>(bytes.data()), bytes.size()};
}

void readLibrary(std::string_view text, std::map<std::string, Maps>& materials)
{
    std::istringstream lines{std::string(text)};
    Maps* current = nullptr;
    for (std::string line; std::getline(lines, line);)
    {
        std::istringstream words(line);
        std::string statement;
        words >> statement;
        if (statement == "newmtl")
            current = &materials[readRest(words)];
        const aiTextureType kind = getKind(statement);
        if (current && kind != aiTextureType_NONE)
            (*current)[kind] = readOptions(words);
    }
}

std::map<std::string, Maps> readMaterials(const std::string& path, ModelFiles& files)
{
    const std::string statement = "mtllib";
    std::map<std::string, Maps> materials;
    std::vector<uint8_t> bytes;
    std::vector<uint8_t> library;
    files.read(path, bytes);
    const std::string_view text = toText(bytes);
    for (size_t at = text.find(statement); at != std::string::npos; at = text.find(statement, at + 1))
    {
        if (at > 0 && text[at - 1] != '\n')
            continue;
        const size_t start = at + statement.size();
        std::istringstream line{std::string(text.substr(start, text.find('\n', start) - start))};
        if (files.readNamed(readRest(line), library))
            readLibrary(toText(library), materials);
    }
    return materials;
}

void apply(const MapOptions& options, aiMesh& mesh)
{
    for (unsigned i = 0; mesh.mTextureCoords[0] && i < mesh.mNumVertices; ++i)
    {
        aiVector3D& uv = mesh.mTextureCoords[0][i];
        uv = aiVector3D(uv.x * options.scale.x + options.offset.x, uv.y * options.scale.y + options.offset.y,
                        uv.z);
    }
}

} // namespace

void correctObj(aiScene& scene, const std::string& path, ModelFiles& files, Report& report)
{
    std::map<std::string, Maps> materials = readMaterials(path, files);
    for (unsigned i = 0; i < scene.mNumMaterials; ++i)
    {
        aiMaterial& material = *scene.mMaterials[i];
        const Maps& maps = materials[material.GetName().C_Str()];
        for (const auto& [kind, map] : maps)
        {
            const aiString file(map.file);
            if (!map.file.empty())
                material.AddProperty(&file, AI_MATKEY_TEXTURE(kind, 0));
        }
        const auto first = maps.find(findMainTexture(material));
        const MapOptions options = first != maps.end() ? first->second : MapOptions();
        for (const auto& map : maps)
        {
            if (!(map.second == options) && material.GetTextureCount(map.first) > 0)
                report.lose("texture-uv-set",
                            "a texture's own transform (it has that of the material's first)");
        }
        for (unsigned m = 0; !(options == MapOptions()) && m < scene.mNumMeshes; ++m)
        {
            if (scene.mMeshes[m]->mMaterialIndex == i)
                apply(options, *scene.mMeshes[m]);
        }
    }
}

} // namespace convert
