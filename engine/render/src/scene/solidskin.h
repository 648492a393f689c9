#pragma once

#include "jointtie.h"

#include "orv/matrix.h"
#include "orv/sharedptr.h"

#include <vector>

namespace orv::detail
{

/// What a solid has that joints move.
struct SolidSkin
{
    struct Joint
    {
        SharedPtr<JointTie> tie; ///< empty when no joint was given
        Matrix4f inverseBind;
        bool bindMirrored; ///< inverseBind flips handedness
    };

    int jointsPerVertex = 0;
    Matrix4f bindShape = Matrix4f::IDENTITY;
    bool bindShapeMirrored = false;
    std::vector<Joint> joints;
};

} // namespace orv::detail
