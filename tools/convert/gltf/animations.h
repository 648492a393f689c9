#pragma once

#include "shapes.h"

#include <memory>

struct aiAnimation;

namespace convert::gltf
{

/// Reads an animation of nodes; its time is in seconds.
///
/// Stepped values get a key for the old and one for the new value at the same time; cubic splines get a key at each
/// sample of the conversion.
/// @param number     of the animation in the file.
/// @param nodeNames  by number of node; empty for nodes that are not in the scene.
/// @param shapes     by number of node, their nodes made. Weights of other nodes are noted as a channel without keys.
std::unique_ptr<aiAnimation> readAnimation(Source& source, size_t number,
                                           const std::vector<std::string>& nodeNames,
                                           const std::map<size_t, MovingShapes>& shapes);

} // namespace convert::gltf
