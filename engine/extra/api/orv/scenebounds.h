#pragma once

#include "orv/bounds.h"
#include "orv/export.h"
#include "orv/vector.h"

#include <vector>

namespace orv
{

class SceneNode;
class Solid;

/// How far a subtree reaches in the world, as it stands: exactly where meshes keep their geometry (MeshData::GEOMETRY), else
/// as the boxes of meshes and of what joints move reach when they are placed. Hidden nodes count too.
/// @param unknown  receives how many solids have meshes whose bounds are not known, which the result leaves out; may be
///                 null.
/// @return unknown without any solid whose bounds are known.
ORV_API Bounds getWorldBounds(SceneNode& top, int* unknown = nullptr);

/// Where the vertices of a solid's mesh are in the world, as its transform or its joints put them at the moment.
/// @param places  replaced; as many as the geometry has vertices.
/// @return false, with no places, unless the mesh keeps its geometry.
ORV_API bool placeVertices(const Solid& solid, std::vector<Vector3f>& places);

} // namespace orv
