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

/// What a light's map shows, and how the world gets there.
struct ShadowView
{
    static constexpr int BORDER = 2; ///< texels around the map's own in which nothing ever stands

    Matrix4f clip = Matrix4f::IDENTITY; ///< from the world, for drawing the map
    Vector4f rows
        [3]; ///< from the world to the map's texture: x and y, of one light from a place times depth; depth
    Vector4f light;      ///< its place with w 1, or the direction towards it with w 0
    float offset = 0.0f; ///< how far surfaces are held off their own shadow; below 0 for each unit of depth
    bool isSpot = false;
};

/// What is known of where shadows are thrown and seen.
struct ShadowReach
{
    const std::vector<Vector3f>* casters = nullptr; ///< corners of boxes around what throws shadows
    bool isAllKnown = true;                         ///< these are all
    Vector3f seenCentre;                            ///< of a sphere around what is seen
    float seenRadius = -1.0f;                       ///< below 0: anything may be seen
};

/// @param size  texels of the map along each side, without the border.
/// @return false where the light throws no shadows there.
bool makeShadowView(const Light& light, const ShadowReach& reach, int size, ShadowView& view);

} // namespace detail
} // namespace orv
