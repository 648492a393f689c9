#include "gltffile.h"

#include "modelfiles.h"

#include <assimp/scene.h>

#include <nlohmann/json.hpp>

#include <cstdint>
#include <vector>

namespace convert
{

namespace
{

using nlohmann::json;

/// Whole files are JSON; in binary ones it begins after 20 bytes of header, in both versions, and fourth comes its
/// size.
json readJson(const std::string& path, ModelFiles& files)
{
    std::vector<uint8_t> file;
    files.read(path, file);
    std::string bytes(file.begin(), file.end());
    constexpr size_t HEADER = 20;
    if (bytes.compare(0, 4, "glTF") == 0 && bytes.size() > HEADER)
    {
        size_t size = 0;
        for (size_t i = 0; i < 4; ++i)
            size |= size_t(static_cast<unsigned char>(bytes[12 + i])) << (8 * i);
        bytes = bytes.substr(HEADER, size);
    }
    return json::parse(bytes, nullptr, false);
}

const json& none()
{
    static const json null;
    return null;
}

/// A member, or null.
const json& get(const json& object, const char* key)
{
    const auto member = object.is_object() ? object.find(key) : object.end();
    return member != object.end() ? *member : none();
}

std::string getText(const json& object, const char* key)
{
    const json& value = get(object, key);
    return value.is_string() ? value.get<std::string>() : std::string();
}

bool getFloats(const json& object, const char* key, float* values, size_t count)
{
    const json& array = get(object, key);
    if (!array.is_array() || array.size() != count)
        return false;
    for (size_t i = 0; i < count; ++i)
    {
        if (!array[i].is_number())
            return false;
        values[i] = array[i].get<float>();
    }
    return true;
}

// ------------------------------------------------------------------------------------------------ glTF 1.0

/// @param node  with translation, rotation and scale, which the importer applies in this order instead of its
///              reverse.
void composeNode(aiNode& target, const json& node)
{
    float t[3] = {0.0f, 0.0f, 0.0f};
    float r[4] = {0.0f, 0.0f, 0.0f, 1.0f};
    float s[3] = {1.0f, 1.0f, 1.0f};
    const bool hasTranslation = getFloats(node, "translation", t, 3);
    getFloats(node, "rotation", r, 4);
    getFloats(node, "scale", s, 3);
    if (hasTranslation)
        target.mTransformation = aiMatrix4x4(
            aiVector3D(s[0], s[1], s[2]), aiQuaternion(r[3], r[0], r[1], r[2]), aiVector3D(t[0], t[1], t[2]));
}

void correctFirstVersion(aiScene& scene, const json& file, Report& report)
{
    const json& nodes = get(file, "nodes");
    for (const auto& [id, node] : nodes.items())
    {
        aiNode* target = scene.mRootNode->FindNode(id.c_str());
        if (target && get(node, "matrix").is_null())
            composeNode(*target, node);
    }
    const size_t animations = get(file, "animations").size();
    if (animations > 0)
        report.lose("gltf1-animations",
                    "the animations of a glTF 1.0 file (" + std::to_string(animations) + ")");
    const size_t skins = get(file, "skins").size();
    if (skins > 0)
        report.lose("gltf1-skins", "the skins of a glTF 1.0 file (" + std::to_string(skins) + ")");
}

// ------------------------------------------------------------------------------------------------ glTF 2.0

/// Doubles keys, so that each value lasts until the next key.
template <class Key>
void step(Key*& keys, unsigned& count)
{
    if (count < 2)
        return;
    std::vector<Key> stepped = {keys[0]};
    for (unsigned i = 1; i < count; ++i)
    {
        stepped.push_back(Key(keys[i].mTime, keys[i - 1].mValue));
        stepped.push_back(keys[i]);
    }
    delete[] keys;
    keys = new Key[stepped.size()];
    std::copy(stepped.begin(), stepped.end(), keys);
    count = unsigned(stepped.size());
}

void stepProperty(aiNodeAnim& channel, const std::string& path)
{
    if (path == "translation")
        step(channel.mPositionKeys, channel.mNumPositionKeys);
    else if (path == "rotation")
        step(channel.mRotationKeys, channel.mNumRotationKeys);
    else if (path == "scale")
        step(channel.mScalingKeys, channel.mNumScalingKeys);
}

/// @param index  a JSON number; null if it is no index of the array.
const json& at(const json& array, const json& index)
{
    const bool isThere = array.is_array() && index.is_number_unsigned() && index.get<size_t>() < array.size();
    return isThere ? array[index.get<size_t>()] : none();
}

aiNodeAnim* findChannel(const aiAnimation& animation, const std::string& node)
{
    for (unsigned i = 0; i < animation.mNumChannels; ++i)
    {
        if (node == animation.mChannels[i]->mNodeName.C_Str())
            return animation.mChannels[i];
    }
    return nullptr;
}

void correctAnimation(aiAnimation& animation, const json& source, const json& nodes, Report& report)
{
    for (const json& channel : get(source, "channels"))
    {
        const std::string interpolation =
            getText(at(get(source, "samplers"), get(channel, "sampler")), "interpolation");
        if (interpolation == "CUBICSPLINE")
            report.approximate("cubic-splines", "curves of animation \"" +
                                                    std::string(animation.mName.C_Str()) +
                                                    "\" (straight between their keys)");
        if (interpolation != "STEP")
            continue;
        const json& index = get(get(channel, "target"), "node");
        const json& node = at(nodes, index);
        const std::string name = getText(node, "name");
        aiNodeAnim* made = findChannel(animation, !name.empty() || node.is_null()
                                                      ? name
                                                      : "nodes[" + std::to_string(index.get<size_t>()) + "]");
        if (made)
            stepProperty(*made, getText(get(channel, "target"), "path"));
    }
}

void correctSecondVersion(aiScene& scene, const json& file, Report& report)
{
    const json& animations = get(file, "animations");
    if (animations.size() != scene.mNumAnimations)
        return;
    for (unsigned i = 0; i < scene.mNumAnimations; ++i)
        correctAnimation(*scene.mAnimations[i], animations[i], get(file, "nodes"), report);
}

} // namespace

void correctGltf(aiScene& scene, const std::string& path, bool isFirstVersion, ModelFiles& files,
                 Report& report)
{
    if (!isFirstVersion && scene.mNumAnimations == 0)
        return; // what is wrong there is only in animations
    const json file = readJson(path, files);
    if (isFirstVersion)
        correctFirstVersion(scene, file, report);
    else
        correctSecondVersion(scene, file, report);
}

} // namespace convert
