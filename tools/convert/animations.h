#pragma once

#include "glo/glowriter.h"
#include "names.h"
#include "options.h"
#include "report.h"

#include <map>
#include <string>

struct aiNode;
struct aiScene;

namespace convert
{

/// Samples the movement of nodes to stepped keys.
/// @param nodeNames  what the model's nodes are called in the scene.
std::vector<glo::AnimationData> convertAnimations(const aiScene& scene,
                                                  const std::map<const aiNode*, std::string>& nodeNames,
                                                  const Options& options, Report& report);

} // namespace convert
