#pragma once

#include "orv/bounds.h"
#include "orv/export.h"

namespace orv
{

class Animation;
class SceneNode;

/// The bounds of a subtree in the world over a whole animation: getWorldBounds() at the times of all keys, since
/// stepped values change only there. The subtree is left at the animation's end.
/// @param steps  samples from key to key, for interpolated animations; 1 or less: only the keys.
ORV_API Bounds getWorldBounds(SceneNode& top, Animation& animation, int steps);

} // namespace orv
