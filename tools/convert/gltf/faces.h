#pragma once

#include <cstddef>
#include <cstdint>
#include <vector>

namespace convert::gltf
{

/// Points, lines or triangles, corner by corner.
struct Faces
{
    unsigned cornersPerFace = 0; ///< 0 for an invalid mode
    std::vector<uint32_t> corners;
    size_t dropped = 0; ///< faces with an index out of range, or with missing indices at the end
};

/// @param mode         0 to 6: points, lines, a loop, a strip, triangles, a strip, a fan.
/// @param vertexCount  above all indices that are taken.
Faces makeFaces(size_t mode, const std::vector<uint32_t>& indices, size_t vertexCount);

} // namespace convert::gltf
