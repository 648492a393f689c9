#pragma once

#include <cstdint>
#include <string>
#include <vector>

/// Random sequences of an application's calls, compared with a naive model: which nodes are alive, where they are, what
/// is drawn with which program, buffers, texture and value, and that nothing is left.
namespace sequence
{

/// Runs a sequence given as bytes. One at a time.
/// @return the difference between engine and model, with the number of steps; empty for none.
std::string play(const std::vector<uint8_t>& bytes);

} // namespace sequence
