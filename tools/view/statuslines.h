#pragma once

#include "headsup.h"

#include "stage/framestats.h"
#include "stage/player.h"

#include <string>
#include <vector>

namespace orv
{
class SceneNode;
}

namespace view
{

// The lines at the top of the window, with a line break before each but the first.

/// "60 fps   3 draws   4,212 triangles   20 GL calls"
std::string describeFrame(const FrameStats& stats, uint64_t triangleCount);

/// The clip, the player's position and state; "" if nothing moves.
std::string describeClip(const Player& player);

/// A row for each node of a tree: its indented name, its kind, and whether it or an ancestor is hidden.
std::vector<HeadsUp::Row> listNodes(const orv::SceneNode& top);

} // namespace view
