#include "meshes.h"

#include <assimp/mesh.h>

#include <cmath>

namespace convert
{

namespace
{

glo::FloatAttribute makeAttribute(const char* name, int componentCount, const aiVector3D* values,
                                  unsigned count, Report& report)
{
    glo::FloatAttribute attribute{name, componentCount, {}};
    attribute.values.reserve(size_t(count) * size_t(componentCount));
    for (unsigned i = 0; i < count; ++i)
    {
        for (int c = 0; c < componentCount; ++c)
        {
            const float value = float(values[i][unsigned(c)]);
            if (!std::isfinite(value))
                report.lose("a vertex value that is not a number (0 instead)");
            attribute.values.push_back(std::isfinite(value) ? value : 0.0f);
        }
    }
    return attribute;
}

} // namespace

glo::Geometry convertMesh(const aiMesh& mesh, const ConvertedMaterial& material, const std::string& name,
                          Report& report)
{
    const unsigned count = mesh.mNumVertices;
    std::vector<glo::FloatAttribute> attributes;
    attributes.push_back(makeAttribute("a_position", 3, mesh.mVertices, count, report));
    if (mesh.mNormals)
        attributes.push_back(makeAttribute("a_normal", 3, mesh.mNormals, count, report));
    const unsigned channel = material.uvChannel;
    if (channel < AI_MAX_NUMBER_OF_TEXTURECOORDS && mesh.mTextureCoords[channel])
        attributes.push_back(makeAttribute("a_uv0", 2, mesh.mTextureCoords[channel], count, report));
    if (material.hasNormalMap && mesh.mTangents && mesh.mBitangents)
    {
        attributes.push_back(makeAttribute("a_tangent", 3, mesh.mTangents, count, report));
        attributes.push_back(makeAttribute("a_binormal", 3, mesh.mBitangents, count, report));
    }
    else if (material.hasNormalMap)
        report.lose("a normal map on a mesh without texture coordinates");

    glo::Geometry geometry;
    geometry.name = name;
    geometry.vertices = glo::makeVertexSet(attributes);
    glo::IndexData indices;
    for (unsigned face = 0; face < mesh.mNumFaces; ++face)
    {
        if (mesh.mFaces[face].mNumIndices != 3)
            continue; // lines and points among triangles
        for (unsigned corner = 0; corner < 3; ++corner)
            indices.indices.push_back(uint16_t(mesh.mFaces[face].mIndices[corner]));
    }
    geometry.primitiveSets.push_back({glo::primitive::TRIANGLES, std::move(indices)});

    if (mesh.mNumBones > 0)
        report.lose("a skin (skins are not converted yet; the mesh keeps its pose)");
    if (mesh.mNumAnimMeshes > 0)
        report.lose("morph targets (not converted yet)");
    if (mesh.mColors[0])
        report.lose("vertex colours");
    return geometry;
}

bool leavesPicture(const aiMesh& mesh, unsigned uvChannel)
{
    constexpr float SLACK = 0.01f;
    if (uvChannel >= AI_MAX_NUMBER_OF_TEXTURECOORDS || !mesh.mTextureCoords[uvChannel])
        return false;
    for (unsigned i = 0; i < mesh.mNumVertices; ++i)
    {
        const aiVector3D& uv = mesh.mTextureCoords[uvChannel][i];
        if (!(uv.x >= -SLACK && uv.x <= 1.0f + SLACK && uv.y >= -SLACK && uv.y <= 1.0f + SLACK))
            return true;
    }
    return false;
}

} // namespace convert
