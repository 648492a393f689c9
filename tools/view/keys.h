#pragma once

#include "headsup.h"

#include <cstdint>
#include <vector>

namespace view
{

/// What a key of the viewer's window does.
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
    GO_TO_TENTH, ///< by the digit
    FASTER,
    SLOWER,
    TOGGLE_LOOPING,
    STEP_CLIP,       ///< backwards with shift
    SAVE_SCREENSHOT, ///< with the writing, with shift
    STEP_BACKGROUND,
    TOGGLE_BOUNDS,
    TOGGLE_SKELETONS,
    TOGGLE_AXES,
    TOGGLE_GRID,
    TOGGLE_WIREFRAME,
    TOGGLE_SHADOWS,
    HIDE, ///< what is under the pointer; everything shown again, with shift
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

/// Every key, and what the mouse does, with what they mean, as the window shows them. docs/view.md has the same rows.
std::vector<HeadsUp::Row> listKeys();

} // namespace view
