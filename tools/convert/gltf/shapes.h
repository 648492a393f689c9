#pragma once

#include "source.h"

struct aiNodeAnim;

namespace convert::gltf
{

/// The shapes of a node's mesh while the weights of its morph targets are animated. The scene has a node with a mesh
/// for each shape below that node; all but the visible one are scaled to zero.
struct MovingShapes
{
    /// The visible shape by start time in seconds; the first one starts at 0.
    using Changes = std::vector<std::pair<double, size_t>>;

    std::vector<std::vector<float>> weights; ///< by shape; the first one is that at rest
    std::map<size_t, Changes> changes;       ///< by number of the animation; in others the mesh is at rest
    std::vector<std::string> nodes;          ///< by shape, once they are made
};

/// By number of the node. None for a node whose mesh would need too many shapes or vertices, or is skinned.
/// @param nodeNames  by number of the node; empty for nodes that the scene has not.
std::map<size_t, MovingShapes> findMovingShapes(Source& source, const std::vector<std::string>& nodeNames);

/// The channels that show the shapes one after the other.
/// @param animation  its number.
/// @return owned by the caller; none if the animation does not change the mesh.
std::vector<aiNodeAnim*> showShapes(const MovingShapes& shapes, size_t animation);

} // namespace convert::gltf
