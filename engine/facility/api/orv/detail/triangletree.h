#pragma once

#include "orv/bounds.h"

#include <cstdint>
#include <vector>

namespace orv::detail
{

/// Boxes around the triangles of a mesh, in halves; empty until it is needed.
struct TriangleTree
{
    /// A box around triangles: its two halves follow it, or it has a few in order.
    struct Node
    {
        Box box;
        uint32_t first; ///< in order, or else the second half
        uint32_t count; ///< 0 with halves
    };

    std::vector<uint32_t> order; ///< of triangles
    std::vector<Node> nodes;
};

} // namespace orv::detail
