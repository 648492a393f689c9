#pragma once

#include "glo/glowriter.h"
#include "materials.h"

struct aiMesh;

namespace convert
{

/// Triangles with positions, normals, and as far as there are such texture coordinates (a_uv0) and, where the
/// material has a normal map, tangents and binormals.
/// @param name  of the geometry.
glo::Geometry convertMesh(const aiMesh& mesh, const ConvertedMaterial& material, const std::string& name,
                          Report& report);

/// Whether texture coordinates of the channel lie outside 0 to 1.
bool leavesPicture(const aiMesh& mesh, unsigned uvChannel);

} // namespace convert
