#pragma once

#include "model.h"
#include "outputfiles.h"

#include <string>
#include <vector>

namespace convert
{

/// A report for a person, some lines.
/// @param path   of the model file.
/// @param files  textures, then the scene.
std::string toText(const std::string& path, const std::vector<OutputFile>& files,
                   const ConvertedModel& model);

/// The same for a program; docs/convert.md describes it.
std::string toJson(const std::string& path, const std::vector<OutputFile>& files,
                   const ConvertedModel& model);

} // namespace convert
