#include "frustum.h"

#include <algorithm>
#include <cmath>
#include <limits>

namespace orv::detail
{

namespace
{

struct Plane
{
    Vector4f coefficients; ///< times a place with w 1: above 0 inside
    Vector4f terms;        ///< the sums of absolute values, for the rounding error
};

Plane makePlane(const Vector4f& w, const Vector4f& row, float side)
{
    const auto size = [](float a, float b) { return std::fabs(a) + std::fabs(b); };
    return {w + row * side, Vector4f(size(w.x, row.x), size(w.y, row.y), size(w.z, row.z), size(w.w, row.w))};
}

} // namespace

Frustum::Frustum()
{
    for (Lanes& offsets : m_offset)
        offsets = fill(std::numeric_limits<float>::infinity());
}

Frustum::Frustum(const Matrix4f& view, const Matrix4f& projection) : Frustum()
{
    constexpr float ROUNDING = 5e-7f; // relative to the largest term of a distance
    const Matrix4f rows = transpose(projection * view);
    Plane planes[6];
    float reach = 0.0f;
    for (int i = 0; i < 6; ++i)
    {
        planes[i] = makePlane(rows[3], rows[i / 2], i % 2 ? -1.0f : 1.0f);
        const float size = length(planes[i].coefficients.xyz());
        const float distance = std::fabs(planes[i].coefficients.w) / size;
        if (std::isfinite(distance))
            reach = std::max(reach, distance);
    }
    for (int i = 0; i < 6; ++i)
    {
        const Vector4f& plane = planes[i].coefficients;
        const float size = length(plane.xyz());
        const float slack = ROUNDING * (2.0f * reach * length(planes[i].terms.xyz()) + planes[i].terms.w);
        if (!(std::isfinite(size + slack) && size > 0.0f))
            continue; // a degenerate plane, as for an infinite view
        m_x[i / 4][i % 4] = plane.x / size;
        m_y[i / 4][i % 4] = plane.y / size;
        m_z[i / 4][i % 4] = plane.z / size;
        m_offset[i / 4][i % 4] = (plane.w + slack) / size;
    }
}

Frustum::Sight Frustum::look(const Vector3f& centre, float negativeRadius) const
{
    if (hides(centre, negativeRadius))
        return Sight::OUTSIDE;
    const Lanes distances = getLeastDistances(widen(centre));
    return areAll(distances >= fill(-negativeRadius)) ? Sight::INSIDE : Sight::CROSSING;
}

void HullSight::add(const Vector3f& centre, float negativeRadius)
{
    for (int half = 0; half < 2; ++half)
        m_outside[half] &= m_frustum.getDistances(half, Frustum::widen(centre)) < fill(negativeRadius);
}

} // namespace orv::detail
