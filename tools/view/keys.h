#pragma once

#include "headsup.h"

#include <cstdint>
#include <vector>

namespace view
{

/// The commands of keys in the viewer's window.
enum class Command
{
    NONE,
    FRAME_ALL,
    STEP_CAMERA, ///< backwards with shift
    TOGGLE_PAUSED,
    FRAME_ON,
    FRAME_BACK,
    SKIP_ON,
    SKIP_BACK,
    GO_TO_START,
    GO_TO_END,
    GO_TO_TENTH, ///< the pressed digit
    FASTER,
    SLOWER,
    TOGGLE_LOOPING,
    STEP_CLIP,       ///< backwards with shift
    SAVE_SCREENSHOT, ///< with shift: including the text
    STEP_BACKGROUND,
    TOGGLE_BOUNDS,
    TOGGLE_SKELETONS,
    TOGGLE_AXES,
    TOGGLE_GRID,
    TOGGLE_WIREFRAME,
    TOGGLE_SHADOWS,
    HIDE, ///< the node under the pointer; with shift: show all again
    TOGGLE_TREE,
    TREE_UP,
    TREE_DOWN,
    TOGGLE_FULL_SCREEN,
    TOGGLE_LINES,
    RELOAD,
    TOGGLE_KEYS,
    QUIT
};

/// @param key  of a window::Event.
Command findCommand(int32_t key);

/// All keys and mouse actions with their meanings, as shown in the window. docs/view.md has the same rows.
std::vector<HeadsUp::Row> listKeys();

} // namespace view
