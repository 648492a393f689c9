#pragma once

#include <cstdint>
#include <vector>

namespace convert
{

/// Faces of a mesh as numbers of vertices, the same count for each face.
using Corners = std::vector<uint32_t>;

/// One more than the highest number.
uint32_t countVertices(const Corners& corners);

/// Orders triangles so that a GPU finds most of their vertices in its vertex cache.
Corners orderForCache(const Corners& corners);

} // namespace convert
