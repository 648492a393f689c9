#pragma once

#include "cacheorder.h"
#include "convert/scene/skins.h"

#include <cstdint>
#include <vector>

namespace convert
{

/// Splits faces into groups that one geometry each can hold: no more vertices than 16-bit indices count, no more
/// joints than a shader takes. Triangles are ordered for a GPU's vertex cache, and those of a group are adjacent. No
/// face is lost or split.
/// @param cornersPerFace  1 to 3.
/// @param influences      by number of vertex; empty without a skin.
std::vector<Corners> splitFaces(const Corners& corners, unsigned cornersPerFace,
                                const std::vector<Influences>& influences);

/// The joints that move the vertices of some faces, in ascending order.
std::vector<uint16_t> listJoints(const Corners& corners, const std::vector<Influences>& influences);

} // namespace convert
