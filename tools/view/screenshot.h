#pragma once

#include <string>

namespace view
{

/// Writes the current surface, without its alpha, as a PNG in the current folder: "duck-001.png", or the next number
/// that is free.
/// @param stem  the name before the number.
/// @return a message for the user.
std::string saveScreenshot(const std::string& stem, int width, int height);

} // namespace view
