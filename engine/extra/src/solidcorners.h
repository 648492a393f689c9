#pragma once

#include "orv/vector.h"

#include <vector>

namespace orv
{

class Solid;

namespace detail
{

/// Adds corners of boxes in the world around a solid, if its mesh has bounds: the eight of its box, or those of a box
/// for each joint. Nothing for a solid without a mesh.
void addBoundsCorners(const Solid& solid, std::vector<Vector3f>& corners);

} // namespace detail
} // namespace orv
