#pragma once

#include <cstdint>
#include <string>
#include <vector>

/// Random sequences of what an application can do with the engine, held against a naive model of it: which nodes are
/// alive, where they are, what is drawn with which program, buffers, texture and value, and that nothing is left.
namespace sequence
{

/// Plays a sequence, whose bytes say what is done to what. A program runs one after another.
/// @return what the engine and the model disagree on, after how many steps; empty for nothing.
std::string play(const std::vector<uint8_t>& bytes);

} // namespace sequence
