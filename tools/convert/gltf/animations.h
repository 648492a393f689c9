#pragma once

#include "source.h"

#include <memory>

struct aiAnimation;

namespace convert::gltf
{

/// Reads an animation of nodes; its time is in seconds.
///
/// Values that step get a key for their old value and one for the new at the same time; cubic splines a key wherever
/// the conversion takes a sample.
/// @param nodeNames  by number of node; empty for nodes that the scene has not.
std::unique_ptr<aiAnimation> readAnimation(Source& source, const Object& animation,
                                           const std::vector<std::string>& nodeNames);

} // namespace convert::gltf
