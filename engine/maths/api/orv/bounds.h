#pragma once

#include "orv/export.h"
#include "orv/matrix.h"
#include "orv/vector.h"

#include <algorithm>
#include <cstddef>
#include <limits>

namespace orv
{

/// A box along the axes. Starts empty, with its lowest corner above its highest one.
struct ORV_API Box
{
    /// The corner of the smallest coordinates; infinite while the box is empty.
    Vector3f lowest{std::numeric_limits<float>::infinity(), std::numeric_limits<float>::infinity(),
                    std::numeric_limits<float>::infinity()};
    Vector3f highest = -lowest; ///< The opposite corner.

    /// Whether nothing has been added.
    bool isEmpty() const
    {
        return !(lowest.x <= highest.x && lowest.y <= highest.y && lowest.z <= highest.z);
    }

    /// Grows until the place is inside. Coordinates that are not numbers change nothing.
    void add(const Vector3f& place)
    {
        lowest =
            Vector3f(std::min(lowest.x, place.x), std::min(lowest.y, place.y), std::min(lowest.z, place.z));
        highest = Vector3f(std::max(highest.x, place.x), std::max(highest.y, place.y),
                           std::max(highest.z, place.z));
    }
    void add(const Box& box); ///< Grows around another box.

    Vector3f getCentre() const { return (lowest + highest) * 0.5f; } ///< Its middle.
};

/// The box around what becomes of the eight corners; an empty box stays empty.
/// @param m  affine: there is no division by w.
ORV_API Box transform(const Box& box, const Matrix4f& m);

/// How far something reaches. Starts as unknown.
struct ORV_API Bounds
{
    Box box; ///< Around all of it.
    /// Of a sphere about the box's centre, around the same; below 0 while the bounds are unknown.
    float radius = -1.0f;

    Bounds() = default;
    /// With the sphere around the whole box; an empty box is unknown.
    explicit Bounds(const Box& box);
    Bounds(const Box& boxAround, float radiusAround) : box(boxAround), radius(radiusAround) {}

    bool isKnown() const { return radius >= 0.0f; } ///< Whether anything is known.
};

/// Around places; unknown where there are none. Places that are not finite are left out.
ORV_API Bounds computeBounds(const Vector3f* places, std::size_t count);

} // namespace orv
