#pragma once

#include "convert/meshes/parts.h"

#include <assimp/vector3.h>

struct aiMesh;

namespace convert
{

/// The triangle's normal, towards its front, of twice its area's length.
aiVector3D getFaceNormal(const aiMesh& mesh, const Corners& corners, size_t first);

/// Normals for a mesh that has none, one for each corner of its triangles: smooth where faces meet at less than 66
/// degrees, sharp elsewhere.
std::vector<aiVector3D> makeNormals(const aiMesh& mesh, const Corners& corners);

/// The same with all edges sharp.
std::vector<aiVector3D> makeFlatNormals(const aiMesh& mesh, const Corners& corners);

/// The directions in which texture coordinates grow, at right angles to the normals, one for each corner. Corners of
/// the same position, normal and coordinates share them, except across a mirrored seam.
struct Tangents
{
    std::vector<aiVector3D> alongU;
    std::vector<aiVector3D> alongV;
};

/// @param normals  of the corners.
/// @param uvs      of the mesh's vertices.
Tangents makeTangents(const aiMesh& mesh, const Corners& corners, const std::vector<aiVector3D>& normals,
                      const aiVector3D* uvs);

} // namespace convert
