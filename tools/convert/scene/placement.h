#pragma once

#include "glo/glowriter.h"

#include <assimp/types.h>

namespace convert
{

/// A rotation as in scene files: axis, then angle in radians.
orv::Vector4f toAxisAngle(const aiQuaternion& rotation);

orv::Vector3f toVector(const aiVector3D& v);

orv::Matrix4f toMatrix(const aiMatrix4x4& m);

/// Scales, then rotates, then moves. (The constructor of libassimp's matrix rotates before it scales.)
aiMatrix4x4 compose(const aiVector3D& translation, const aiQuaternion& rotation, const aiVector3D& scale);

/// Sets a node's transform, as a matrix and as components, which are used as soon as one of them is set.
/// @return false if components cannot express it (shear); the node gets the nearest transform.
bool place(glo::NodeData& node, const aiMatrix4x4& transform);

/// Two nested transforms that components can express, whose product they cannot.
struct Nested
{
    aiMatrix4x4 outer;
    aiMatrix4x4 inner; ///< a rotation
};

/// Splits any affine transform.
Nested splitShear(const aiMatrix4x4& transform);

/// A transform that moves to position and turns -z to direction and +y as near to up as possible.
aiMatrix4x4 lookingAlong(const aiVector3D& position, const aiVector3D& direction, const aiVector3D& up);

} // namespace convert
