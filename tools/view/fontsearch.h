#pragma once

#include <string>
#include <vector>

namespace view
{

/// The folders in which systems and users keep fonts.
std::vector<std::string> getFontFolders();

/// The best known plain typeface (DejaVu Sans, Liberation Sans, Noto Sans ...) below these folders.
/// @return its path, "" if there is none.
std::string findFont(const std::vector<std::string>& folders);

} // namespace view
