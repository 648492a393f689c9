#pragma once

#include "options.h"

#include <string>

namespace view
{

/// Draws what the options ask for into PNG files, without a window.
/// @param scenePath  the scene file, which for a model is the converted one.
/// @param error      set on failure; "" for pictures that differ too much, of which was told already.
bool drawPictures(const Options& options, const std::string& scenePath, std::string& error);

} // namespace view
