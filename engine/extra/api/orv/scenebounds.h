#pragma once

#include "orv/bounds.h"
#include "orv/export.h"
#include "orv/vector.h"

#include <vector>

namespace orv
{

class SceneNode;
class Solid;

/// The current bounds of a subtree in the world: exact if meshes keep their geometry (MeshData::GEOMETRY), otherwise
/// from the transformed boxes of meshes and of the vertices of each joint. Hidden nodes count too.
/// @param unknown  receives how many solids have meshes whose bounds are not known, which the result leaves out; may be
///                 null.
/// @return unknown if there is no solid of known bounds.
ORV_API Bounds getWorldBounds(SceneNode& top, int* unknown = nullptr);

/// The bounds of a solid in its own space: those of its mesh or, if isMovedByJoints(), of its current pose. A pose is
/// exact if the mesh keeps its geometry; from the bounds of its joints it is larger.
/// @return unknown if the mesh's bounds are, or without a mesh.
ORV_API Bounds getOwnBounds(const Solid& solid);

/// Whether joints move the vertices of a solid: it has joints, and its program reads J_WORLD.
ORV_API bool isMovedByJoints(const Solid& solid);

/// The current positions of a solid's vertices in the world, by its transform or its joints.
/// @param places  replaced: one position for each vertex.
/// @return false, with places empty, unless the mesh keeps its geometry.
ORV_API bool placeVertices(const Solid& solid, std::vector<Vector3f>& places);

} // namespace orv
