#include "halflifefile.h"

#include "convert/files/modelfiles.h"

#include <assimp/scene.h>

#include <algorithm>
#include <cstdint>
#include <vector>

namespace convert
{

namespace
{

/// The numbers of the bones' parents, -1 for none. Bones come after their parents.
std::vector<int32_t> readParents(const std::string& path, ModelFiles& files, size_t count)
{
    constexpr size_t BONE_COUNT = 140; // offset in the header; the first bone's offset follows
    constexpr size_t BONE_SIZE = 112;
    constexpr size_t PARENT = 32; // in a bone
    std::vector<uint8_t> bytes;
    files.read(path, bytes);
    const auto read = [&](size_t at)
    {
        uint32_t number = 0;
        for (size_t i = 0; i < 4 && at + i < bytes.size(); ++i)
            number |= uint32_t(bytes[at + i]) << (8 * i);
        return int32_t(number);
    };
    std::vector<int32_t> parents;
    if (size_t(read(BONE_COUNT)) != count)
        return parents;
    const size_t first = uint32_t(read(BONE_COUNT + 4));
    for (size_t i = 0; i < count; ++i)
    {
        const int32_t parent = read(first + i * BONE_SIZE + PARENT);
        parents.push_back(parent >= 0 && size_t(parent) < i ? parent : -1);
    }
    return parents;
}

void giveChildren(aiNode& node, const std::vector<aiNode*>& children)
{
    delete[] node.mChildren;
    node.mChildren = children.empty() ? nullptr : new aiNode*[children.size()];
    std::copy(children.begin(), children.end(), node.mChildren);
    node.mNumChildren = unsigned(children.size());
    for (aiNode* child : children)
        child->mParent = &node;
}

/// The bones' transforms, from bone to parent, are the file's. Their offset matrices lead from the mesh, which was
/// built with the wrong tree too, back to the file's vertices in bone space. So correcting the tree also corrects the
/// skins.
void hangBones(aiNode& holder, const std::string& path, ModelFiles& files)
{
    const std::vector<aiNode*> bones(holder.mChildren, holder.mChildren + holder.mNumChildren);
    const std::vector<int32_t> parents = readParents(path, files, bones.size());
    if (parents.empty()) // a later version of the library may already be right
        return;
    for (int32_t i = -1; i < int32_t(parents.size()); ++i)
    {
        std::vector<aiNode*> children;
        for (size_t child = 0; child < parents.size(); ++child)
        {
            if (parents[child] == i)
                children.push_back(bones[child]);
        }
        giveChildren(i < 0 ? holder : *bones[size_t(i)], children);
    }
}

double findLastKey(const aiAnimation& animation)
{
    double last = 0.0;
    for (unsigned i = 0; i < animation.mNumChannels; ++i)
    {
        const aiNodeAnim& channel = *animation.mChannels[i];
        if (channel.mNumPositionKeys > 0)
            last = std::max(last, channel.mPositionKeys[channel.mNumPositionKeys - 1].mTime);
        if (channel.mNumRotationKeys > 0)
            last = std::max(last, channel.mRotationKeys[channel.mNumRotationKeys - 1].mTime);
    }
    return last;
}

} // namespace

void correctHalfLife(aiScene& scene, const std::string& path, ModelFiles& files)
{
    for (unsigned i = 0; i < scene.mNumAnimations; ++i)
        scene.mAnimations[i]->mDuration = findLastKey(*scene.mAnimations[i]);
    aiNode* bones = scene.mRootNode->FindNode("<MDL_bones>");
    if (bones && bones->mNumChildren > 0)
        hangBones(*bones, path, files);
}

} // namespace convert
