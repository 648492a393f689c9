#include "mending.h"

#include "badnumbers.h"

#include <assimp/scene.h>

#include <algorithm>
#include <string>
#include <vector>

namespace convert
{

namespace
{

constexpr unsigned GONE = ~0u;

template <class Operation>
void forEachNode(aiNode& node, const Operation& operation)
{
    operation(node);
    for (unsigned i = 0; i < node.mNumChildren; ++i)
        forEachNode(*node.mChildren[i], operation);
}

void dropNullChildren(aiNode& node)
{
    aiNode** end = std::remove(node.mChildren, node.mChildren + node.mNumChildren, nullptr);
    node.mNumChildren = unsigned(end - node.mChildren);
}

/// @param array  owned pointers; unwanted objects are deleted.
/// @return by old number the new one, or GONE.
template <class Thing, class IsWanted>
std::vector<unsigned> sift(Thing** array, unsigned& count, const IsWanted& isWanted)
{
    std::vector<unsigned> numbers;
    unsigned kept = 0;
    for (unsigned i = 0; i < count; ++i)
    {
        const bool wanted = array[i] && isWanted(*array[i]);
        numbers.push_back(wanted ? kept : GONE);
        if (wanted)
            array[kept++] = array[i];
        else
            delete array[i];
    }
    count = kept;
    return numbers;
}

void renumberMeshes(aiNode& node, const std::vector<unsigned>& numbers)
{
    unsigned kept = 0;
    for (unsigned i = 0; i < node.mNumMeshes; ++i)
    {
        const unsigned number = node.mMeshes[i] < numbers.size() ? numbers[node.mMeshes[i]] : GONE;
        if (number != GONE)
            node.mMeshes[kept++] = number;
    }
    node.mNumMeshes = kept;
}

void makePoints(aiMesh& mesh)
{
    mesh.mNumFaces = mesh.mNumVertices;
    mesh.mFaces = new aiFace[mesh.mNumFaces];
    for (unsigned i = 0; i < mesh.mNumFaces; ++i)
    {
        mesh.mFaces[i].mNumIndices = 1;
        mesh.mFaces[i].mIndices = new unsigned[1]{i};
    }
    mesh.mPrimitiveTypes = aiPrimitiveType_POINT;
}

/// Drops faces without corners or with invalid vertex numbers.
/// @return false if all faces were dropped.
bool dropBadFaces(aiMesh& mesh, Report& report)
{
    const auto isBad = [&](const aiFace& face)
    {
        return face.mNumIndices == 0 || !face.mIndices ||
               std::any_of(face.mIndices, face.mIndices + face.mNumIndices,
                           [&](unsigned index) { return index >= mesh.mNumVertices; });
    };
    unsigned kept = 0;
    for (unsigned i = 0; i < mesh.mNumFaces; ++i)
    {
        if (isBad(mesh.mFaces[i]))
            continue;
        if (kept != i)
            std::swap(mesh.mFaces[kept], mesh.mFaces[i]);
        ++kept;
    }
    if (kept == mesh.mNumFaces)
        return true;
    report.lose("face", "faces of mesh \"" + std::string(mesh.mName.C_Str()) + "\" that are damaged");
    mesh.mNumFaces = kept;
    return kept > 0;
}

/// Some importers forget to list a kind of face.
void nameKinds(aiMesh& mesh)
{
    for (unsigned i = 0; i < mesh.mNumFaces; ++i)
        mesh.mPrimitiveTypes |= AI_PRIMITIVE_TYPE_FOR_N_INDICES(mesh.mFaces[i].mNumIndices);
}

/// A material for meshes whose material does not exist.
void giveMaterials(aiScene& scene)
{
    const unsigned count = scene.mNumMaterials;
    for (unsigned i = 0; i < scene.mNumMeshes; ++i)
    {
        if (scene.mMeshes[i]->mMaterialIndex < count)
            continue;
        if (scene.mNumMaterials == count)
        {
            aiMaterial** materials = new aiMaterial*[count + 1];
            std::copy(scene.mMaterials, scene.mMaterials + count, materials);
            materials[count] = new aiMaterial;
            delete[] scene.mMaterials;
            scene.mMaterials = materials;
            scene.mNumMaterials = count + 1;
        }
        scene.mMeshes[i]->mMaterialIndex = count;
    }
}

/// @return the time of the last key.
template <class Key>
double sortKeys(Key* keys, unsigned count)
{
    const auto isEarlier = [](const Key& a, const Key& b) { return a.mTime < b.mTime; };
    if (!std::is_sorted(keys, keys + count, isEarlier))
        std::stable_sort(keys, keys + count, isEarlier);
    return count > 0 ? keys[count - 1].mTime : 0.0;
}

/// Some importers return unsorted keys, or an end time before the last key.
void sortKeys(aiAnimation& animation)
{
    for (unsigned i = 0; i < animation.mNumChannels; ++i)
    {
        aiNodeAnim& channel = *animation.mChannels[i];
        const double last = std::max({sortKeys(channel.mPositionKeys, channel.mNumPositionKeys),
                                      sortKeys(channel.mRotationKeys, channel.mNumRotationKeys),
                                      sortKeys(channel.mScalingKeys, channel.mNumScalingKeys)});
        animation.mDuration = std::max(animation.mDuration, last);
    }
}

} // namespace

void mend(aiScene& scene, Report& report)
{
    forEachNode(*scene.mRootNode, dropNullChildren);
    const std::vector<unsigned> numbers = sift(
        scene.mMeshes, scene.mNumMeshes,
        [&](aiMesh& mesh) { return mesh.mNumVertices > 0 && mesh.mVertices && dropBadFaces(mesh, report); });
    giveMaterials(scene);
    forEachNode(*scene.mRootNode, [&](aiNode& node) { renumberMeshes(node, numbers); });
    for (unsigned i = 0; i < scene.mNumMeshes; ++i)
    {
        if (scene.mMeshes[i]->mNumFaces == 0)
            makePoints(*scene.mMeshes[i]);
        nameKinds(*scene.mMeshes[i]);
    }
    const auto hasNode = [&](const auto& thing)
    {
        const bool has = scene.mRootNode->FindNode(thing.mName);
        if (!has)
            report.lose("homeless",
                        "\"" + std::string(thing.mName.C_Str()) + "\", a light or camera without a node");
        return has;
    };
    sift(scene.mLights, scene.mNumLights, hasNode);
    sift(scene.mCameras, scene.mNumCameras, hasNode);
    const auto moves = [&](const aiAnimation& animation)
    {
        const bool does =
            animation.mNumChannels + animation.mNumMeshChannels + animation.mNumMorphMeshChannels > 0;
        if (!does)
            report.lose("animation",
                        "animation \"" + std::string(animation.mName.C_Str()) + "\", which moves nothing");
        return does;
    };
    sift(scene.mAnimations, scene.mNumAnimations, moves);
    replaceBadNumbers(scene, report);
    for (unsigned i = 0; i < scene.mNumAnimations; ++i)
        sortKeys(*scene.mAnimations[i]);
}

} // namespace convert
