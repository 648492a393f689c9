#pragma once

#include "orv/detail/lanes.h"
#include "orv/matrix.h"

namespace orv::detail
{

/// The view volume of one eye: six planes, slightly widened for rounding errors.
class Frustum
{
public:
    enum class Sight
    {
        OUTSIDE, ///< of one plane at least
        CROSSING,
        INSIDE
    };

    /// Sees everything.
    Frustum();
    Frustum(const Matrix4f& view, const Matrix4f& projection);

    /// Whether a sphere is outside. A sphere with NaN is not.
    /// @param negativeRadius  minus infinity is never outside.
    bool hides(const Vector3f& centre, float negativeRadius) const
    {
        return isAny(getLeastDistances(widen(centre)) < fill(negativeRadius));
    }

    /// Whether a point is inside of all planes by a distance at least. Never for NaN.
    /// @param point  its w does not count.
    /// @param distance  below 0 for a point that may be outside by as much.
    [[gnu::always_inline]] bool contains(const Vector4f& point, float distance) const
    {
        return areAll(getLeastDistances(load(point.data())) >= fill(distance));
    }

    /// The same for a point that has to be transformed first.
    [[gnu::always_inline]] bool contains(const Matrix4f& transform, const Vector3f& point,
                                         float distance) const
    {
        const LaneMatrix m = load(transform);
        const Lanes place = m.x * fill(point.x) + m.y * fill(point.y) + m.z * fill(point.z) + m.w;
        return areAll(getLeastDistances(place) >= fill(distance));
    }

    Sight look(const Vector3f& centre, float negativeRadius) const;

private:
    friend class HullSight;

    static Lanes widen(const Vector3f& v) { return Lanes{v.x, v.y, v.z, 1.0f}; }

    /// @param point  whose last lane does not count.
    [[gnu::always_inline]] Lanes getDistances(int half, Lanes point) const
    {
        return m_x[half] * spread<0>(point) + m_y[half] * spread<1>(point) + m_z[half] * spread<2>(point) +
               m_offset[half];
    }

    /// Of two planes each.
    [[gnu::always_inline]] Lanes getLeastDistances(Lanes point) const
    {
        const Lanes first = getDistances(0, point);
        const Lanes second = getDistances(1, point);
        return first < second ? first : second;
    }

    // Eight planes with unit normals that point inside; unused planes contain everything.
    Lanes m_x[2] = {};
    Lanes m_y[2] = {};
    Lanes m_z[2] = {};
    Lanes m_offset[2];
};

/// The same for the convex hull of spheres: outside if all spheres are outside of one plane.
class HullSight
{
public:
    explicit HullSight(const Frustum& frustum) : m_frustum(frustum) {}

    void add(const Vector3f& centre, float negativeRadius);
    bool isHidden() const { return isAny(m_outside[0] | m_outside[1]); }

private:
    const Frustum& m_frustum;
    LaneAnswers m_outside[2] = {{-1, -1, -1, -1}, {-1, -1, -1, -1}};
};

} // namespace orv::detail
