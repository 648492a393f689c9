#pragma once

#include "convert/materials/materials.h"
#include "glo/glowriter.h"

#include <vector>

struct aiMesh;

namespace convert
{

/// A geometry and, if it is skinned, the mesh's bones by joint number; the number after the last bone is the mesh's own
/// node.
struct MeshPart
{
    glo::Geometry geometry; ///< without a name
    std::vector<uint16_t> bones;
};

/// Triangles, lines or points with positions and the mesh's other attributes: normals, two sets of texture coordinates,
/// a colour, joints and weights; and tangents and binormals if the material has a normal map. Identical vertices are
/// joined, faces without area are left out.
/// @param mesh  all of its faces have the same number of corners, 1 to 3.
/// @return as many parts as the limits of geometries require; none if nothing is left.
std::vector<MeshPart> convertMesh(const aiMesh& mesh, const ConvertedMaterial& material, Report& report);

/// Whether the vertices have colours. All white or all black does not count: some importers add such colours.
/// @param mayBeBlack  all black counts too.
bool isColoured(const aiMesh& mesh, bool mayBeBlack);

/// Whether texture coordinates of the channel lie outside 0 to 1.
bool leavesPicture(const aiMesh& mesh, unsigned uvChannel);

} // namespace convert
