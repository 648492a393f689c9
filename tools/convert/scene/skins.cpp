#include "skins.h"

#include <assimp/mesh.h>

#include <algorithm>

namespace convert
{

namespace
{

/// Keeps the four strongest; of equal ones the earlier.
/// @return whether one was dropped.
bool addInfluence(Influences& influences, uint16_t joint, float weight)
{
    auto& [joints, weights] = influences;
    const auto place =
        std::find_if(weights.begin(), weights.end(), [=](float other) { return weight > other; });
    const float last = weights.back();
    if (place != weights.end())
    {
        const auto jointPlace = joints.begin() + (place - weights.begin());
        std::copy_backward(jointPlace, joints.end() - 1, joints.end());
        std::copy_backward(place, weights.end() - 1, weights.end());
        *jointPlace = joint;
        *place = weight;
    }
    return place == weights.end() || last > 0.0f;
}

void normalise(Influences& influences, uint16_t ownNode)
{
    float sum = 0.0f;
    for (const float weight : influences.weights)
        sum += weight;
    if (sum <= 0.0f)
    {
        influences = {{ownNode}, {1.0f}};
        return;
    }
    for (float& weight : influences.weights)
        weight /= sum;
}

} // namespace

std::vector<Influences> gatherInfluences(const aiMesh& mesh, Report& report)
{
    constexpr unsigned MOST_BONES = 65535;
    if (mesh.mNumBones > MOST_BONES)
        report.lose("skin", "the skin of mesh \"" + std::string(mesh.mName.C_Str()) +
                                "\", which has too many joints");
    if (mesh.mNumBones == 0 || mesh.mNumBones > MOST_BONES)
        return {};
    std::vector<Influences> vertices(mesh.mNumVertices);
    std::vector<bool> isCut(mesh.mNumVertices);
    for (unsigned bone = 0; bone < mesh.mNumBones; ++bone)
    {
        for (unsigned i = 0; i < mesh.mBones[bone]->mNumWeights; ++i)
        {
            const aiVertexWeight& weight = mesh.mBones[bone]->mWeights[i];
            const bool counts = weight.mVertexId < mesh.mNumVertices && weight.mWeight > 0.0f;
            if (counts && addInfluence(vertices[weight.mVertexId], uint16_t(bone), float(weight.mWeight)))
                isCut[weight.mVertexId] = true;
        }
    }
    for (Influences& influences : vertices)
        normalise(influences, uint16_t(mesh.mNumBones));
    const auto cut = uint64_t(std::count(isCut.begin(), isCut.end(), true));
    if (cut > 0)
        report.approximate("joint-weights", "vertices of mesh \"" + std::string(mesh.mName.C_Str()) +
                                                "\" with more than four joints (the strongest four)");
    report.count("vertices-with-more-than-four-joints", cut);
    return vertices;
}

} // namespace convert
