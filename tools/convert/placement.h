#pragma once

#include "glo/glowriter.h"

#include <assimp/types.h>

namespace convert
{

/// As a scene file has rotations: axis, then angle in radians.
orv::Vector4f toAxisAngle(const aiQuaternion& rotation);

orv::Vector3f toVector(const aiVector3D& v);

/// Gives a node the transform, in components and in the matrix that these make.
/// @return false if components cannot hold it (it shears); the node gets what is nearest.
bool place(glo::NodeData& node, const aiMatrix4x4& transform);

/// A transform that moves to position and turns -z to direction and +y as near to up as possible.
aiMatrix4x4 lookingAlong(const aiVector3D& position, const aiVector3D& direction, const aiVector3D& up);

} // namespace convert
