#pragma once

#include <set>
#include <string>

namespace view
{

/// A model file and its companions: files in its folder and in subfolders whose names occur in the model or in a text
/// file among its companions, such as a material library. This works for every format, but misses names that a model
/// spells differently.
std::set<std::string> findCompanions(const std::string& model);

} // namespace view
