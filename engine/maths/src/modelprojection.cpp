#include "orv/detail/modelprojection.h"

namespace orv::detail
{

ModelProjection::ModelProjection(const Matrix4f& view, const Matrix4f& projection)
{
    const float* p = projection.data();
    m_isUsable = isAffine(view) && p[1] == 0.0f && p[2] == 0.0f && p[3] == 0.0f && p[4] == 0.0f &&
                 p[6] == 0.0f && p[7] == 0.0f;
    Matrix4f doubled = view;
    for (Vector4f& column : doubled.columns)
        column.w = column.z;
    m_view = load(doubled);
    m_scale = Lanes{p[0], p[5], p[10], p[11]};
    m_skew = Lanes{p[8], p[9], 0.0f, 0.0f};
    m_last = load(projection.columns[3].data());
    m_isSkewed = p[8] != 0.0f || p[9] != 0.0f;
}

Matrix4f ModelProjection::multiplySkewed(const Matrix4f& world) const
{
    const LaneMatrix placed = multiplyAffine(m_view, load(world));
    const auto project = [this](Lanes column) { return column * m_scale + m_skew * spread<2>(column); };
    Matrix4f result;
    store(result, {project(placed.x), project(placed.y), project(placed.z), project(placed.w) + m_last});
    return result;
}

} // namespace orv::detail
