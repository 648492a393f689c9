#pragma once

#include "convert/materials/materials.h"
#include "glo/glowriter.h"

#include <vector>

struct aiMesh;

namespace convert
{

/// A geometry and, if a skin moves it, the mesh's bones that its joint numbers count: the number after the last
/// bone's is the mesh's own node.
struct MeshPart
{
    glo::Geometry geometry; ///< without a name
    std::vector<uint16_t> bones;
};

/// Triangles, lines or points with positions and what else the mesh has: normals, two sets of texture coordinates,
/// a colour, joints and weights; and tangents and binormals if the material has a normal map. Vertices that are the
/// same all over are joined, faces that have no area are left out.
/// @param mesh  all of its faces have the same number of corners, 1 to 3.
/// @return in as many parts as the limits of geometries ask for; none if nothing is left.
std::vector<MeshPart> convertMesh(const aiMesh& mesh, const ConvertedMaterial& material, Report& report);

/// Whether the vertices have colours: not all of them white or all of them black, which some importers of the library
/// put where there are none.
/// @param mayBeBlack  black is a colour as any other.
bool isColoured(const aiMesh& mesh, bool mayBeBlack);

/// Whether texture coordinates of the channel lie outside 0 to 1.
bool leavesPicture(const aiMesh& mesh, unsigned uvChannel);

} // namespace convert
