#pragma once

#include "orbit.h"
#include "player.h"

#include <vector>

namespace view
{

class Stage;

/// One picture to be drawn: its time and the eye's angle around the scene.
struct Shot
{
    float time = 0.0f; ///< seconds on the time line
    float turn = 0.0f; ///< radians
};

/// Finds a view from the front, slightly from the right and above, that shows the whole scene in all shots. Leaves the
/// player at one of them.
Orbit frameScene(Stage& stage, Player& player, const std::vector<Shot>& shots, int width, int height);

} // namespace view
