#include "mending.h"

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

/// @param array  of pointers that are owned; those that are not wanted are deleted.
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

} // namespace

void mend(aiScene& scene, Report& report)
{
    forEachNode(*scene.mRootNode, dropNullChildren);
    const std::vector<unsigned> numbers =
        sift(scene.mMeshes, scene.mNumMeshes,
             [](const aiMesh& mesh) { return mesh.mNumVertices > 0 && mesh.mVertices; });
    forEachNode(*scene.mRootNode, [&](aiNode& node) { renumberMeshes(node, numbers); });
    for (unsigned i = 0; i < scene.mNumMeshes; ++i)
    {
        if (scene.mMeshes[i]->mNumFaces == 0)
            makePoints(*scene.mMeshes[i]);
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
}

} // namespace convert
