#include "faces.h"

#include <algorithm>

namespace convert::gltf
{

namespace
{

enum Mode
{
    POINTS,
    LINES,
    LINE_LOOP,
    LINE_STRIP,
    TRIANGLES,
    TRIANGLE_STRIP,
    TRIANGLE_FAN,
    MODE_COUNT
};

constexpr unsigned CORNERS[MODE_COUNT] = {1, 2, 2, 2, 3, 3, 3};

size_t countFaces(size_t mode, size_t count)
{
    const unsigned corners = CORNERS[mode];
    if (mode == LINE_LOOP)
        return count < 2 ? 0 : count;
    if (mode == POINTS || mode == LINES || mode == TRIANGLES)
        return count / corners;
    return count < corners ? 0 : count - corners + 1;
}

/// The position of a face's corner among the indices.
size_t place(size_t mode, size_t face, unsigned corner, size_t count)
{
    switch (mode)
    {
    case LINE_LOOP: return (face + corner) % count;
    case LINE_STRIP: return face + corner;
    case TRIANGLE_STRIP: // every second one has the opposite winding
        return face % 2 == 1 && corner > 0 ? face + 3 - corner : face + corner;
    case TRIANGLE_FAN: return corner == 2 ? 0 : face + corner + 1;
    default: return face * CORNERS[mode] + corner;
    }
}

} // namespace

Faces makeFaces(size_t mode, const std::vector<uint32_t>& indices, size_t vertexCount)
{
    Faces made;
    if (mode >= MODE_COUNT)
        return made;
    made.cornersPerFace = CORNERS[mode];
    const size_t count = countFaces(mode, indices.size());
    made.corners.reserve(count * made.cornersPerFace);
    const bool isList = mode == LINES || mode == TRIANGLES;
    made.dropped = isList && indices.size() % made.cornersPerFace != 0 ? 1 : 0;
    for (size_t face = 0; face < count; ++face)
    {
        uint32_t corners[3];
        for (unsigned c = 0; c < made.cornersPerFace; ++c)
            corners[c] = indices[place(mode, face, c, indices.size())];
        const bool isThere = std::all_of(corners, corners + made.cornersPerFace,
                                         [&](uint32_t corner) { return corner < vertexCount; });
        if (isThere)
            made.corners.insert(made.corners.end(), corners, corners + made.cornersPerFace);
        else
            ++made.dropped;
    }
    return made;
}

} // namespace convert::gltf
