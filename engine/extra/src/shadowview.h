#pragma once

#include "orv/bounds.h"
#include "orv/matrix.h"
#include "orv/vector.h"

#include <vector>

namespace orv
{

class Light;

namespace detail
{

/// The view of a light's map, and the transforms into it.
struct ShadowView
{
    static constexpr int BORDER = 2; ///< empty texels around the map

    Matrix4f clip = Matrix4f::IDENTITY; ///< from the world, for drawing the map
    Vector4f rows[3];    ///< from the world to the map's texture: x, y (for a spot times depth), depth
    Vector4f light;      ///< its position with w 1, or the direction towards it with w 0
    float offset = 0.0f; ///< of lookups along the normal; if negative, for each unit of depth
    bool isSpot = false;
};

/// The bounds of casters and of the visible part.
struct ShadowReach
{
    const std::vector<Vector3f>* casters = nullptr; ///< corners of boxes around casters
    bool isAllKnown = true;                         ///< whether these are complete
    Vector3f seenCentre;                            ///< of a sphere around the visible part
    float seenRadius = -1.0f;                       ///< below 0: anything may be seen
};

/// @param size  texels of the map along each side, without the border.
/// @return false if the light casts no shadows there.
bool makeShadowView(const Light& light, const ShadowReach& reach, int size, ShadowView& view);

} // namespace detail
} // namespace orv
