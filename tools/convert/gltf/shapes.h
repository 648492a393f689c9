#pragma once

#include "source.h"

struct aiNodeAnim;

namespace convert::gltf
{

/// The shapes that a node's mesh goes through while the weights of its morph targets move. The scene has a mesh for each
/// of them in a node of its own below that node; all but the one that is seen are scaled to nothing.
struct MovingShapes
{
    /// Which shape is seen from when on, in seconds; the first one from 0 on.
    using Changes = std::vector<std::pair<double, size_t>>;

    std::vector<std::vector<float>> weights; ///< by shape; the first one is that at rest
    std::map<size_t, Changes> changes;       ///< by number of the animation; others leave the mesh at rest
    std::vector<std::string> nodes;          ///< by shape, once they are made
};

/// By number of the node. One whose mesh would become too many meshes or vertices, or is moved by joints too, has none.
/// @param nodeNames  by number of the node; empty for nodes that the scene has not.
std::map<size_t, MovingShapes> findMovingShapes(Source& source, const std::vector<std::string>& nodeNames);

/// What shows the shapes one after the other.
/// @param animation  its number.
/// @return the caller's; none if the animation leaves the mesh alone.
std::vector<aiNodeAnim*> showShapes(const MovingShapes& shapes, size_t animation);

} // namespace convert::gltf
