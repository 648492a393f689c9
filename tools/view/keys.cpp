#include "keys.h"

#include "window/window.h"

#include <algorithm>

namespace view
{

namespace
{

using namespace window;

const HeadsUp::Row MOUSE[] = {
    {"left button", "turn"},           {"right or middle button, shift + left", "move"},
    {"wheel", "nearer and farther"},   {"double click", "move the eye closer to that point"},
    {"drop a file", "show that file"},
};

struct Binding
{
    Command command;
    std::vector<int32_t> keys;
};

/// Keys listed in one row.
struct Group
{
    HeadsUp::Row row;
    std::vector<Binding> bindings;
};

const std::vector<Group>& getGroups()
{
    static const std::vector<Group> GROUPS = {
        {{"f", "the whole scene"}, {{Command::FRAME_ALL, {'f'}}}},
        {{"c, shift + c", "next and previous camera of the file, and the free one"},
         {{Command::STEP_CAMERA, {'c'}}}},
        {{"space", "play and pause"}, {{Command::TOGGLE_PAUSED, {' '}}}},
        {{". ,", "one frame (1/30 s) forward and back"},
         {{Command::FRAME_ON, {'.'}}, {Command::FRAME_BACK, {','}}}},
        {{"right, left", "a twentieth of the clip forward and back"},
         {{Command::SKIP_ON, {key::RIGHT}}, {Command::SKIP_BACK, {key::LEFT}}}},
        {{"home, end, 0 to 9", "start, end, or that tenth of the clip"},
         {{Command::GO_TO_START, {key::HOME}},
          {Command::GO_TO_END, {key::END}},
          {Command::GO_TO_TENTH, {'0', '1', '2', '3', '4', '5', '6', '7', '8', '9'}}}},
        {{"+ -", "double and halve the speed"},
         {{Command::FASTER, {'+', '=', key::KEYPAD_PLUS}}, // = for keyboards that have + on the same key
          {Command::SLOWER, {'-', key::KEYPAD_MINUS}}}},
        {{"l", "loop, or stop at the end"}, {{Command::TOGGLE_LOOPING, {'l'}}}},
        {{"n, shift + n", "next and previous clip"}, {{Command::STEP_CLIP, {'n'}}}},
        {{"s, shift + s", "save a picture in the current folder, without and with the text"},
         {{Command::SAVE_SCREENSHOT, {'s'}}}},
        {{"b", "next background"}, {{Command::STEP_BACKGROUND, {'b'}}}},
        {{"o", "boxes around what is drawn"}, {{Command::TOGGLE_BOUNDS, {'o'}}}},
        {{"j", "joints, or the node hierarchy if there are none"}, {{Command::TOGGLE_SKELETONS, {'j'}}}},
        {{"a", "axes of nodes: x red, y green, z blue"}, {{Command::TOGGLE_AXES, {'a'}}}},
        {{"g", "a grid on the ground"}, {{Command::TOGGLE_GRID, {'g'}}}},
        {{"w", "wireframe"}, {{Command::TOGGLE_WIREFRAME, {'w'}}}},
        {{"d", "shadows of the first directional or spot light"}, {{Command::TOGGLE_SHADOWS, {'d'}}}},
        {{"v, shift + v", "hide the node under the pointer, and show all nodes again"},
         {{Command::HIDE, {'v'}}}},
        {{"t, up, down", "the tree of nodes, and scroll it"},
         {{Command::TOGGLE_TREE, {'t'}}, {Command::TREE_UP, {key::UP}}, {Command::TREE_DOWN, {key::DOWN}}}},
        {{"f11", "full screen on and off"}, {{Command::TOGGLE_FULL_SCREEN, {key::F11}}}},
        {{"i", "the text on and off"}, {{Command::TOGGLE_LINES, {'i'}}}},
        {{"r", "load again (done automatically when a file changes)"}, {{Command::RELOAD, {'r'}}}},
        {{"h", "these keys"}, {{Command::TOGGLE_KEYS, {'h', key::F1}}}},
        {{"q, escape", "leave"}, {{Command::QUIT, {'q', key::ESCAPE}}}},
    };
    return GROUPS;
}

} // namespace

Command findCommand(int32_t key)
{
    for (const Group& group : getGroups())
    {
        for (const Binding& binding : group.bindings)
        {
            if (std::find(binding.keys.begin(), binding.keys.end(), key) != binding.keys.end())
                return binding.command;
        }
    }
    return Command::NONE;
}

std::vector<HeadsUp::Row> listKeys()
{
    std::vector<HeadsUp::Row> rows(std::begin(MOUSE), std::end(MOUSE));
    for (const Group& group : getGroups())
        rows.push_back(group.row);
    return rows;
}

} // namespace view
