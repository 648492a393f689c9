#pragma once

#include "orv/export.h"
#include "orv/vector.h"

#include <cstdint>
#include <vector>

namespace orv
{

class MeshGeometry;
struct Ray;

/// Which sides of triangles count: their fronts are those from which their corners go round counter-clockwise.
enum class TriangleSides
{
    NONE,
    FRONT,
    BACK,
    BOTH
};

/// A triangle of a mesh that a ray meets.
struct MeshHit
{
    float distance = 0.0f; ///< times the ray's direction
    uint32_t triangle = 0; ///< counted from 0 in the order of drawing
};

/// Finds the nearest triangle that a ray meets, of equally near ones the first.
///
/// Threads: one at a time for one geometry. The first look for a triangle sorts them, which takes some tenths of a second
/// for 100,000.
/// @param ray  in the mesh's own space, with a direction of any length.
/// @param hit  in: what is farther, or as far, does not count; out: the triangle.
/// @return false, with hit unchanged, if there is none.
ORV_API bool meet(const MeshGeometry& geometry, const Ray& ray, TriangleSides sides, MeshHit& hit);

/// The same with the vertices at other places, as many as it has, as joints may hold them; triangle by triangle.
ORV_API bool meet(const MeshGeometry& geometry, const Ray& ray, TriangleSides sides,
                  const std::vector<Vector3f>& places, MeshHit& hit);

} // namespace orv
