#pragma once

#include "orv/vector.h"

#include <vector>

namespace orv
{

class Solid;

namespace detail
{

/// Adds corners of boxes in the world around all that a solid draws, as far as its mesh has bounds: the eight of its box, or
/// of one box for each joint. Of a solid without a mesh nothing.
void addBoundsCorners(const Solid& solid, std::vector<Vector3f>& corners);

} // namespace detail
} // namespace orv
