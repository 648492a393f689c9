#pragma once

#include "orv/meshcache.h"
#include "orv/vector.h"

namespace orv
{

/// The length of the longest position, for a bounding radius.
/// @param array  floats, a position in the first three components of each vertex.
/// @return 0 for a null array, or, after logging an assertion, for one of other than 4-byte components.
ORV_API float computeMaximumLength(const SharedPtr<VertexArray>& array);

/// The box around all positions, and the sphere about its centre, for Mesh::setBounds().
/// @param array  as for computeMaximumLength().
/// @return unknown for a null array, one without vertices, or, after logging an assertion, one of other than 4-byte
/// components.
ORV_API Bounds computeBounds(const SharedPtr<VertexArray>& array);

/// Built-in shapes: triangle lists, committed, with a_position, a_normal and a_uv0, front faces counter-clockwise
/// from outside. Texture coordinates run from 0 to uvScale, v upwards, so a scale above 1 repeats the texture.
/// The meshes are unnamed in the cache. @return empty, after an error, where memory lacks.

/// A sphere of radius 0.5 whose poles are on the y axis, in rings of quads. Seen from outside, u grows to the left.
/// @param segments  rings from pole to pole; @param wedges  quads around. Below 2 either becomes 2, with a
/// warning. (segments + 1) x (wedges + 1) vertices must fit 16-bit indices: beyond 65,536 the result is empty.
ORV_API Mesh::Ptr createSphereMesh(MeshCache& cache, unsigned int segments, unsigned int wedges,
                                   const Vector2f& uvScale);

/// A cube with corners at -1 and +1. Each face has the whole texture, upright seen from outside; up is +y on the
/// sides, -z on the top and +z on the bottom.
ORV_API Mesh::Ptr createCubeMesh(MeshCache& cache, const Vector2f& uvScale);

/// The square from -0.5 to 0.5 in the plane z = 0, facing +z. Its bounding radius is a generous sqrt(2).
ORV_API Mesh::Ptr createSquareMesh(MeshCache& cache, const Vector2f& uvScale);

} // namespace orv
