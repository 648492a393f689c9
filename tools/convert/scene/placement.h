#pragma once

#include "glo/glowriter.h"

#include <assimp/types.h>

namespace convert
{

/// As a scene file has rotations: axis, then angle in radians.
orv::Vector4f toAxisAngle(const aiQuaternion& rotation);

orv::Vector3f toVector(const aiVector3D& v);

orv::Matrix4f toMatrix(const aiMatrix4x4& m);

/// Scales, then turns, then moves. (The constructor of libassimp's matrix turns first and scales then.)
aiMatrix4x4 compose(const aiVector3D& translation, const aiQuaternion& rotation, const aiVector3D& scale);

/// Gives a node the transform, as a matrix and in components, which take over when one of them is set.
/// @return false if components cannot hold it, but for rounding (it shears); the node gets what is nearest.
bool place(glo::NodeData& node, const aiMatrix4x4& transform);

/// Two transforms that components can hold and that make a third, which they cannot, one in the other.
struct Nested
{
    aiMatrix4x4 outer;
    aiMatrix4x4 inner; ///< a turn
};

/// Takes any transform without perspective apart.
Nested splitShear(const aiMatrix4x4& transform);

/// A transform that moves to position and turns -z to direction and +y as near to up as possible.
aiMatrix4x4 lookingAlong(const aiVector3D& position, const aiVector3D& direction, const aiVector3D& up);

} // namespace convert
