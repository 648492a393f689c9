#pragma once

#include "orv/export.h"
#include "orv/vector.h"

#include <cstdint>
#include <vector>

namespace orv
{

class MeshGeometry;
struct Ray;

/// Which sides of triangles count. Fronts are counter-clockwise.
enum class TriangleSides
{
    NONE,
    FRONT,
    BACK,
    BOTH
};

/// A triangle of a mesh that a ray hits.
struct MeshHit
{
    float distance = 0.0f; ///< times the ray's direction
    uint32_t triangle = 0; ///< counted from 0 in the order of drawing
};

/// Finds the nearest triangle that a ray hits; of equally near ones the first.
///
/// Threads: one at a time for one geometry. The first call builds a tree of the triangles, which takes some tenths of a
/// second for 100,000.
/// @param ray  in the mesh's own space, with a direction of any length.
/// @param hit  in: its distance is the limit, exclusive; out: the triangle.
/// @return false, with hit unchanged, if there is none.
ORV_API bool meet(const MeshGeometry& geometry, const Ray& ray, TriangleSides sides, MeshHit& hit);

/// The same with other positions of its vertices, such as skinned ones; tests each triangle.
ORV_API bool meet(const MeshGeometry& geometry, const Ray& ray, TriangleSides sides,
                  const std::vector<Vector3f>& places, MeshHit& hit);

} // namespace orv
