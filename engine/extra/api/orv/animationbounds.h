#pragma once

#include "orv/bounds.h"
#include "orv/export.h"

namespace orv
{

class Animation;
class SceneNode;

/// How far a subtree reaches in the world over a whole animation: getWorldBounds() at the times of all its keys, between
/// which nothing changes. The subtree is left as the animation's end has it.
/// @param steps  how many times there are from key to key, for animations that interpolate; 1 or less: the keys alone.
ORV_API Bounds getWorldBounds(SceneNode& top, Animation& animation, int steps);

} // namespace orv
