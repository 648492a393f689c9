#include "orv/camera.h"

#include "orv/log.h"
#include "orv/scenenodevisitor.h"

#include <cmath>

namespace orv
{

namespace
{

/// Clipping distances that a perspective projection can be made from.
struct ClipRange
{
    float nearDistance;
    float farDistance;
    bool nearWasZero;
    bool wasEmpty;
};

ClipRange usableClipRange(float nearDistance, float farDistance)
{
    ClipRange range = {nearDistance, farDistance, nearDistance == 0.0f, false};
    if (range.nearWasZero)
        range.nearDistance = farDistance / 1000.0f;
    range.wasEmpty = range.nearDistance == range.farDistance;
    if (range.wasEmpty)
    {
        range.nearDistance = 1.0f;
        range.farDistance = 1000.0f;
    }
    return range;
}

/// 0 for 0: a view without extent gives a zero projection instead of infinities and NaN.
float reciprocal(float x)
{
    return x != 0.0f ? 1.0f / x : 0.0f;
}

} // namespace

void Camera::accept(SceneNodeVisitor& visitor)
{
    visitor.visit(this);
}

void Camera::setFieldOfView(const Anglef& fieldOfView)
{
    if (m_projectionType == ProjectionType::ORTHOGRAPHIC)
        ORV_LOG_WARN("Setting FOV while using an ORTHOGRAPHIC projection will have no visible effect until a "
                     "PERSPECTIVE projection is used.");
    m_fieldOfView = fieldOfView;
}

void Camera::setWidth(float width)
{
    if (m_projectionType == ProjectionType::PERSPECTIVE)
        ORV_LOG_WARN(
            "Setting width while using an PERSPECTIVE projection will have no visible effect until a "
            "ORTHOGRAPHIC projection is used.");
    m_width = width;
}

void Camera::setStereo(float focalDistance, float eyeSeparation)
{
    if (m_projectionType == ProjectionType::ORTHOGRAPHIC && eyeSeparation != 0.0f)
        ORV_LOG_WARN("Setting stereo parameters while using an ORTHOGRAPHIC projection will have no visible "
                     "effect until a PERSPECTIVE projection is used.");
    m_stereoFocalDistance = focalDistance;
    m_stereoEyeSeparation = eyeSeparation;
}

void Camera::getProjection(Matrix4f* out, float aspect)
{
    if (m_projectionType == ProjectionType::PERSPECTIVE)
    {
        const ClipRange range = usableClipRange(m_near, m_far);
        if (range.nearWasZero)
            ORV_LOG_WARN("Near clipping distance modified to be non-zero.");
        if (range.wasEmpty)
            ORV_LOG_WARN("Clipping plane separation was zero.");
        m_near = range.nearDistance;
        m_far = range.farDistance;
    }
    *out = calculateProjection(aspect, m_near, m_far);
}

void Camera::getStereoProjection(Matrix4f* left, Matrix4f* right, float aspect) const
{
    if (m_projectionType == ProjectionType::ORTHOGRAPHIC)
    {
        *left = *right = calculateProjection(aspect, m_near, m_far);
        return;
    }

    const ClipRange range = usableClipRange(m_near, m_far);
    *left = *right = calculateProjection(aspect, range.nearDistance, range.farDistance);
    if (!std::isfinite(m_stereoFocalDistance) || m_stereoFocalDistance == 0.0f)
        return;

    // The left eye stands half the separation to the left, so its frustum leans to the right, by
    // separation / 2 * near / focal distance at the near plane. Column 2 holds that shift over the half width
    // of the near plane, which is near / x scale.
    const float lean = left->columns[0].x * m_stereoEyeSeparation * 0.5f / m_stereoFocalDistance;
    left->columns[2].x = lean;
    right->columns[2].x = -lean;
}

void Camera::getStereoWorldTransform(Matrix4f* left, Matrix4f* right) const
{
    *left = *right = getWorldTransform();
    if (m_projectionType == ProjectionType::ORTHOGRAPHIC)
        return; // stereo has no visible effect

    const Vector4f halfSeparation = getWorldTransform().columns[0] * (m_stereoEyeSeparation * 0.5f);
    left->columns[3] -= halfSeparation;
    right->columns[3] += halfSeparation;
}

Matrix4f Camera::calculateProjection(float aspect, float nearDistance, float farDistance) const
{
    if (!std::isfinite(aspect) || aspect == 0.0f)
        aspect = 1.0f;

    Matrix4f projection;
    if (m_projectionType == ProjectionType::ORTHOGRAPHIC)
    {
        const float depth = reciprocal(farDistance - nearDistance);
        projection.columns[0].x = 2.0f * reciprocal(m_width);
        projection.columns[1].y = 2.0f * reciprocal(m_width / aspect);
        projection.columns[2].z = -2.0f * depth;
        projection.columns[3] = Vector4f(0.0f, 0.0f, -(farDistance + nearDistance) * depth, 1.0f);
        return projection;
    }

    const float scale = reciprocal(std::tan(m_fieldOfView.radians() * 0.5f));
    const float depth = reciprocal(nearDistance - farDistance);
    const bool upright = std::fabs(aspect) <= 1.0f;
    projection.columns[0].x = upright ? scale : scale / aspect;
    projection.columns[1].y = upright ? scale * aspect : scale;
    projection.columns[2].z = (nearDistance + farDistance) * depth;
    projection.columns[2].w = -1.0f;
    projection.columns[3].z = 2.0f * farDistance * nearDistance * depth;
    return projection;
}

} // namespace orv
