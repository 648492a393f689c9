#include "fbxpivots.h"

#include "convert/report.h"

#include <assimp/scene.h>

#include <cmath>
#include <cstring>
#include <set>
#include <string>

namespace convert
{

namespace
{

const char* const MARK = "_$AssimpFbx$_"; // in the names of nodes that are part of another one

using Names = std::set<std::string>;

Names listTargets(const aiScene& scene)
{
    Names names;
    for (unsigned i = 0; i < scene.mNumAnimations; ++i)
    {
        const aiAnimation& animation = *scene.mAnimations[i];
        for (unsigned c = 0; c < animation.mNumChannels; ++c)
            names.insert(animation.mChannels[c]->mNodeName.C_Str());
    }
    return names;
}

bool isPartOf(const aiNode& part, const std::string& whole)
{
    const std::string start = whole + MARK;
    return std::string(part.mName.C_Str()).compare(0, start.size(), start) == 0;
}

/// Gives the last of a node's parts the whole transform. The parts above have no other children.
void gather(aiNode& node, const Names& targets)
{
    const std::string name = node.mName.C_Str();
    aiNode* top = &node;
    while (top->mParent && isPartOf(*top->mParent, name))
    {
        top = top->mParent;
        if (targets.count(top->mName.C_Str()) > 0)
            return; // its parts are animated
    }
    for (aiNode* part = &node; part != top;)
    {
        part = part->mParent;
        node.mTransformation = part->mTransformation * node.mTransformation;
        part->mTransformation = aiMatrix4x4();
    }
}

/// The library applies the post-rotation where it should apply its inverse.
void turnBack(aiNodeAnim& channel, const aiNode& node)
{
    const std::string name = node.mName.C_Str();
    const std::string after = name + MARK + "PostRotation";
    const aiNode* part = &node;
    while (part->mParent && isPartOf(*part->mParent, name) && after != part->mName.C_Str())
        part = part->mParent;
    if (after != part->mName.C_Str())
        return;
    const aiQuaternion back = aiQuaternion(aiMatrix3x3(part->mTransformation));
    for (unsigned i = 0; i < channel.mNumRotationKeys; ++i)
        channel.mRotationKeys[i].mValue = channel.mRotationKeys[i].mValue * back * back;
}

void turnBack(aiScene& scene)
{
    for (unsigned i = 0; i < scene.mNumAnimations; ++i)
    {
        const aiAnimation& animation = *scene.mAnimations[i];
        for (unsigned c = 0; c < animation.mNumChannels; ++c)
        {
            const aiNode* node = scene.mRootNode->FindNode(animation.mChannels[c]->mNodeName);
            if (node && !std::strstr(node->mName.C_Str(), MARK))
                turnBack(*animation.mChannels[c], *node);
        }
    }
}

bool hasWideSteps(const aiNodeAnim& channel)
{
    constexpr float WIDE = 0.9659258f; // cosine of half of 30 degrees
    for (unsigned i = 1; i < channel.mNumRotationKeys; ++i)
    {
        const aiQuaternion& a = channel.mRotationKeys[i - 1].mValue;
        const aiQuaternion& b = channel.mRotationKeys[i].mValue;
        if (std::fabs(float(a.w * b.w + a.x * b.x + a.y * b.y + a.z * b.z)) < WIDE)
            return true;
    }
    return false;
}

} // namespace

void correctFbx(aiScene& scene, Report& report)
{
    turnBack(scene);
    const Names targets = listTargets(scene);
    for (const std::string& name : targets)
    {
        aiNode* node =
            name.find(MARK) == std::string::npos ? scene.mRootNode->FindNode(name.c_str()) : nullptr;
        if (node)
            gather(*node, targets);
    }
    for (unsigned i = 0; i < scene.mNumAnimations; ++i)
    {
        const aiAnimation& animation = *scene.mAnimations[i];
        for (unsigned c = 0; c < animation.mNumChannels; ++c)
        {
            if (hasWideSteps(*animation.mChannels[c]))
                report.approximate("rotation-keys",
                                   "rotations of animation \"" + std::string(animation.mName.C_Str()) +
                                       "\" whose keys lie far apart (the shortest way between them)");
        }
    }
}

} // namespace convert
