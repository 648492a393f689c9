#pragma once

#include <set>
#include <string>

namespace view
{

/// A model file and the files that come with it: those in its folder, and in folders in there, whose names stand
/// in the model or in a text file that comes with it, as a material library does. Formats are not looked at, so
/// that this serves for all of them; names that a model writes in another way than the disk are missed.
std::set<std::string> findCompanions(const std::string& model);

} // namespace view
