#pragma once

#include "textures.h"

#include <string>
#include <vector>

namespace convert
{

/// Writes files into a folder, all of them or none: to temporary names first, and when all bytes are there under
/// their own names, the last file of the list last.
/// @param error  "path: reason".
bool writeFiles(const std::string& folder, const std::vector<const OutputFile*>& files, std::string& error);

} // namespace convert
