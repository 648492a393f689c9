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

/// How far a solid reaches in its own space: as its mesh or, where isMovedByJoints(), as what the joints make of it at the
/// moment. That is exact where the mesh keeps its geometry; from the bounds of its joints alone it is wider.
/// @return unknown where the mesh's are, and without a mesh.
ORV_API Bounds getOwnBounds(const Solid& solid);

/// Whether joints move the vertices of a solid when it is drawn: there are some, and its program takes J_WORLD.
ORV_API bool isMovedByJoints(const Solid& solid);

/// Where the vertices of a solid's mesh are in the world, as its transform or its joints put them at the moment.
/// @param places  replaced; as many as the geometry has vertices.
/// @return false, with no places, unless the mesh keeps its geometry.
ORV_API bool placeVertices(const Solid& solid, std::vector<Vector3f>& places);

} // namespace orv
