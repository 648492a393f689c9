#pragma once

#include "orv/detail/lanes.h"
#include "orv/matrix.h"

namespace orv::detail
{

/// A camera's view and projection, ready for many products projection * (view * world), each rounded as operator* rounds
/// it. A projection is mostly zeros: what it does to v is (v.x, v.y, v.z, v.z) * scale + v.z * skew + v.w * last.
class ModelProjection
{
public:
    ModelProjection(const Matrix4f& view, const Matrix4f& projection);

    /// Whether view and projection have this form.
    bool isUsable() const { return m_isUsable; }

    /// @param world  affine.
    [[gnu::always_inline]] Matrix4f multiply(const Matrix4f& world) const
    {
        if (m_isSkewed)
            return multiplySkewed(world);
        const LaneMatrix placed = multiplyAffine(m_view, load(world));
        Matrix4f result;
        store(result,
              {placed.x * m_scale, placed.y * m_scale, placed.z * m_scale, placed.w * m_scale + m_last});
        return result;
    }

private:
    Matrix4f multiplySkewed(const Matrix4f& world) const;

    LaneMatrix m_view; ///< its last row repeats the third
    Lanes m_scale;
    Lanes m_skew; ///< not 0 for an eye of two
    Lanes m_last;
    bool m_isSkewed;
    bool m_isUsable;
};

} // namespace orv::detail
