#pragma once

#include "options.h"

#include <string>

namespace view
{

/// Draws the requested PNG files, without a window.
/// @param scenePath  the scene file, which for a model is the converted one.
/// @param error      set on failure; "" if pictures differ too much, which was printed already.
bool drawPictures(const Options& options, const std::string& scenePath, std::string& error);

} // namespace view
