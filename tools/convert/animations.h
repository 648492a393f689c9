#pragma once

#include "glo/glowriter.h"
#include "names.h"
#include "report.h"

#include <map>
#include <string>

struct aiNode;
struct aiScene;

namespace convert
{

/// Samples the movement of nodes to stepped keys.
/// @param nodeNames  what the model's nodes are called in the scene.
/// @param fps        samples per second, above 0.
std::vector<glo::AnimationData> convertAnimations(const aiScene& scene,
                                                  const std::map<const aiNode*, std::string>& nodeNames,
                                                  double fps, Report& report);

} // namespace convert
