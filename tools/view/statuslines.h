#pragma once

#include "framestats.h"
#include "player.h"

#include <string>

namespace view
{

// The lines at the top of the window, with a line break before each but the first.

/// "60 fps   3 draws   4,212 triangles   20 GL calls"
std::string describeFrame(const FrameStats& stats, uint64_t triangleCount);

/// The clip, where in it the player is, and how it goes on; "" for what does not move.
std::string describeClip(const Player& player);

} // namespace view
