#include "badnumbers.h"

#include <assimp/scene.h>

#include <algorithm>
#include <cmath>
#include <string>

namespace convert
{

namespace
{

constexpr double LARGEST = 1e18; // its square is still a float

bool isGood(double number)
{
    return std::fabs(number) <= LARGEST; // false for NaN
}

bool isGood(const aiMatrix4x4& matrix)
{
    const ai_real* const first = &matrix.a1;
    return std::all_of(first, first + 16, [](ai_real value) { return isGood(double(value)); });
}

bool isGood(const aiVectorKey& key)
{
    return isGood(key.mTime) && isGood(double(key.mValue.x)) && isGood(double(key.mValue.y)) &&
           isGood(double(key.mValue.z));
}

bool isGood(const aiQuatKey& key)
{
    return isGood(key.mTime) && isGood(double(key.mValue.w)) && isGood(double(key.mValue.x)) &&
           isGood(double(key.mValue.y)) && isGood(double(key.mValue.z));
}

class Replacer
{
public:
    explicit Replacer(Report& report) : m_report(report) {}

    void visit(aiNode& node)
    {
        if (!isGood(node.mTransformation))
        {
            tell("the transform of node", node.mName);
            node.mTransformation = aiMatrix4x4();
        }
        for (unsigned i = 0; i < node.mNumChildren; ++i)
            visit(*node.mChildren[i]);
    }

    void visit(aiBone& bone)
    {
        if (!isGood(bone.mOffsetMatrix))
        {
            tell("the bind pose of joint", bone.mName);
            bone.mOffsetMatrix = aiMatrix4x4();
        }
        for (unsigned i = 0; i < bone.mNumWeights; ++i)
        {
            if (isGood(double(bone.mWeights[i].mWeight)))
                continue;
            tell("weights of joint", bone.mName);
            bone.mWeights[i].mWeight = 0.0f;
        }
    }

    void visit(aiNodeAnim& channel)
    {
        drop(channel.mPositionKeys, channel.mNumPositionKeys, channel.mNodeName);
        drop(channel.mRotationKeys, channel.mNumRotationKeys, channel.mNodeName);
        drop(channel.mScalingKeys, channel.mNumScalingKeys, channel.mNodeName);
    }

private:
    template <class Key>
    void drop(Key* keys, unsigned& count, const aiString& node)
    {
        Key* const end = std::remove_if(keys, keys + count, [](const Key& key) { return !isGood(key); });
        if (end != keys + count)
            tell("keys of node", node);
        count = unsigned(end - keys);
    }

    void tell(const char* what, const aiString& whose)
    {
        m_report.lose("number", std::string(what) + " \"" + whose.C_Str() +
                                    "\" with values that are no numbers or too large");
    }

    Report& m_report;
};

} // namespace

void replaceBadNumbers(aiScene& scene, Report& report)
{
    Replacer replacer(report);
    replacer.visit(*scene.mRootNode);
    for (unsigned i = 0; i < scene.mNumMeshes; ++i)
    {
        for (unsigned k = 0; k < scene.mMeshes[i]->mNumBones; ++k)
            replacer.visit(*scene.mMeshes[i]->mBones[k]);
    }
    for (unsigned i = 0; i < scene.mNumAnimations; ++i)
    {
        for (unsigned k = 0; k < scene.mAnimations[i]->mNumChannels; ++k)
            replacer.visit(*scene.mAnimations[i]->mChannels[k]);
    }
}

} // namespace convert
