#pragma once

#include "orbit.h"
#include "player.h"

#include <vector>

namespace view
{

class Stage;

/// One picture to be drawn: when, and how far the eye has gone around the scene.
struct Shot
{
    float time = 0.0f; ///< seconds on the time line
    float turn = 0.0f; ///< radians
};

/// Finds where to look from, from the front, a little from the right and above, so that the whole scene fills a
/// view of that size in all of the shots together. Leaves the player at one of them.
Orbit frameScene(Stage& stage, Player& player, const std::vector<Shot>& shots, int width, int height);

} // namespace view
