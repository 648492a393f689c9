#include "uvtransforms.h"

#include "materials.h"

#include <assimp/scene.h>

#include <cmath>
#include <optional>

namespace convert
{

namespace
{

/// As the file has it: scale, then turn, then move, v going down.
struct Placing
{
    aiVector2D offset;
    aiVector2D scale;
    float cosine;
    float sine;

    /// @param uv  v goes up, as libassimp has it.
    aiVector3D apply(const aiVector3D& uv) const
    {
        const float u = uv.x * scale.x;
        const float v = (1.0f - uv.y) * scale.y;
        return {offset.x + cosine * u + sine * v, 1.0f - (offset.y - sine * u + cosine * v), uv.z};
    }
};

std::optional<aiUVTransform> getTransform(const aiMaterial& material, aiTextureType type)
{
    aiUVTransform transform;
    if (material.Get(AI_MATKEY_UVTRANSFORM(type, 0), transform) != aiReturn_SUCCESS)
        return std::nullopt;
    return transform;
}

/// libassimp's importer moves a transform's centre to the middle of the picture; this is the way back.
Placing toPlacing(const aiUVTransform& made)
{
    const float cosine = std::cos(-made.mRotation);
    const float sine = std::sin(-made.mRotation);
    const aiVector2D& scale = made.mScaling;
    const aiVector2D offset(made.mTranslation.x - 0.5f * scale.x * (1.0f - cosine + sine),
                            0.5f * scale.y * (sine + cosine - 1.0f) + 1.0f - scale.y - made.mTranslation.y);
    return {offset, scale, cosine, sine};
}

bool areEqual(const std::optional<aiUVTransform>& a, const std::optional<aiUVTransform>& b)
{
    if (!a || !b)
        return !a && !b;
    return a->mTranslation == b->mTranslation && a->mScaling == b->mScaling && a->mRotation == b->mRotation;
}

/// @return the transform of all pictures of the material; it has none any more.
std::optional<Placing> takeTransform(aiMaterial& material, Report& report)
{
    const std::optional<aiUVTransform> main = getTransform(material, findMainTexture(material));
    for (int number = aiTextureType_DIFFUSE; number <= AI_TEXTURE_TYPE_MAX; ++number)
    {
        const auto type = aiTextureType(number);
        if (material.GetTextureCount(type) == 0)
            continue;
        if (!areEqual(main, getTransform(material, type)))
            report.lose("texture-uv-set",
                        "coordinates of a texture's own (it has those of the material's first)");
        material.RemoveProperty(AI_MATKEY_UVTRANSFORM(type, 0));
    }
    return main ? std::optional(toPlacing(*main)) : std::nullopt;
}

} // namespace

void transformTextureCoordinates(aiScene& scene, Report& report)
{
    std::vector<std::optional<Placing>> placings;
    for (unsigned i = 0; i < scene.mNumMaterials; ++i)
        placings.push_back(takeTransform(*scene.mMaterials[i], report));
    for (unsigned i = 0; i < scene.mNumMeshes; ++i)
    {
        const aiMesh& mesh = *scene.mMeshes[i];
        if (mesh.mMaterialIndex >= placings.size() || !placings[mesh.mMaterialIndex])
            continue;
        const unsigned channel = findUvChannel(*scene.mMaterials[mesh.mMaterialIndex]);
        aiVector3D* uvs = channel < AI_MAX_NUMBER_OF_TEXTURECOORDS ? mesh.mTextureCoords[channel] : nullptr;
        for (unsigned vertex = 0; uvs && vertex < mesh.mNumVertices; ++vertex)
            uvs[vertex] = placings[mesh.mMaterialIndex]->apply(uvs[vertex]);
    }
}

} // namespace convert
