#include "skins.h"

#include <assimp/mesh.h>

namespace convert::gltf
{

aiMatrix4x4 toMatrix(std::span<const float> values)
{
    aiMatrix4x4 matrix;
    for (unsigned column = 0; column < 4; ++column)
    {
        for (unsigned row = 0; row < 4; ++row)
            matrix[row][column] = values[column * 4 + row];
    }
    return matrix;
}

Skin readSkin(Source& source, const Object& skin, const std::vector<std::string>& nodeNames)
{
    Skin made;
    for (const size_t joint : skin.indices("joints"))
    {
        if (joint >= nodeNames.size())
            skin.fail("joints", "names node " + std::to_string(joint) + ", which is not there");
        made.joints.push_back(nodeNames[joint]);
    }
    made.inverses.resize(made.joints.size());
    const std::optional<size_t> matrices = skin.index("inverseBindMatrices");
    if (!matrices)
        return made;
    const Column column = source.accessors.read(*matrices, skin, 16);
    if (column.count() < made.joints.size())
        skin.fail("inverseBindMatrices", "are fewer than the joints");
    for (size_t i = 0; i < made.joints.size(); ++i)
        made.inverses[i] = toMatrix({column[i], 16});
    return made;
}

void addBones(aiMesh& mesh, const Skin& skin, const std::vector<Column>& joints,
              const std::vector<Column>& weights, Report& report)
{
    std::vector<std::vector<aiVertexWeight>> byJoint(skin.joints.size());
    bool isOver = false;
    for (size_t set = 0; set < joints.size(); ++set)
    {
        for (size_t i = 0; i < joints[set].values.size(); ++i)
        {
            const float weight = weights[set].values[i];
            const float joint = joints[set].values[i];
            if (!(weight > 0.0f))
                continue;
            if (joint >= 0.0f && joint < float(byJoint.size()))
                byJoint[size_t(joint)].emplace_back(unsigned(i / 4), weight);
            else
                isOver = true;
        }
    }
    if (isOver)
        report.lose("joint",
                    "joints of mesh \"" + std::string(mesh.mName.C_Str()) + "\" that its skin lacks");
    std::vector<aiBone*> bones;
    for (size_t i = 0; i < byJoint.size(); ++i)
    {
        if (byJoint[i].empty())
            continue;
        aiBone* bone = bones.emplace_back(new aiBone);
        bone->mName = aiString(skin.joints[i]);
        bone->mOffsetMatrix = skin.inverses[i];
        bone->mNumWeights = unsigned(byJoint[i].size());
        bone->mWeights = new aiVertexWeight[byJoint[i].size()];
        std::copy(byJoint[i].begin(), byJoint[i].end(), bone->mWeights);
    }
    if (bones.empty())
        return;
    mesh.mNumBones = unsigned(bones.size());
    mesh.mBones = new aiBone*[bones.size()];
    std::copy(bones.begin(), bones.end(), mesh.mBones);
}

} // namespace convert::gltf
