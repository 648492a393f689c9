#include "orbit.h"

#include "orv/matrix.h"
#include "orv/sceneutil.h"

#include <algorithm>
#include <cmath>

namespace view
{

using orv::Matrix4f;
using orv::Vector3f;

namespace
{

constexpr float PI = 3.14159265f;
constexpr float RADIANS_PER_PIXEL = PI / 360.0f;
constexpr float MAX_PITCH = PI / 2.0f - 0.001f; // left and right are undefined straight from above

} // namespace

Vector3f Orbit::getDirection() const
{
    return Vector3f(std::sin(yaw) * std::cos(pitch), std::sin(pitch), std::cos(yaw) * std::cos(pitch));
}

void Orbit::setDirection(const Vector3f& towardsEye)
{
    const Vector3f direction = normalize(towardsEye);
    yaw = std::atan2(direction.x, direction.z);
    pitch = std::clamp(std::asin(std::clamp(direction.y, -1.0f, 1.0f)), -MAX_PITCH, MAX_PITCH);
}

void Orbit::turn(float right, float down)
{
    yaw = std::remainder(yaw - right * RADIANS_PER_PIXEL, 2.0f * PI);
    pitch = std::clamp(pitch + down * RADIANS_PER_PIXEL, -MAX_PITCH, MAX_PITCH);
}

void Orbit::pan(float right, float down, float viewHeight)
{
    const Matrix4f place = lookAt(getEye(), middle, Vector3f::Y_AXIS);
    const float unitsPerPixel = 2.0f * distance * std::tan(fieldOfView.radians() / 2.0f) / viewHeight;
    middle += (place[1].xyz() * down - place[0].xyz() * right) * unitsPerPixel;
}

void Orbit::zoom(float steps)
{
    distance = std::clamp(distance * std::pow(ZOOM_STEP, steps), radius * 1e-6f, radius * 1e3f);
}

void Orbit::continueFrom(const orv::Camera& camera)
{
    const Matrix4f& place = camera.getWorldTransform();
    const Vector3f eye = place[3].xyz();
    const Vector3f back = normalize(place[2].xyz());
    const float ahead = dot(eye - middle, back);
    distance = ahead > radius * 1e-3f ? ahead : radius;
    setDirection(back);
    middle = eye - getDirection() * distance;
    if (camera.getProjectionType() == orv::Camera::ProjectionType::PERSPECTIVE)
        fieldOfView = camera.getFieldOfView();
    else
        distance = camera.getWidth() / 2.0f / std::tan(fieldOfView.radians() / 2.0f);
}

void Orbit::apply(orv::Camera& camera) const
{
    const Vector3f eye = getEye();
    const float depth = dot(eye - centre, getDirection());
    if (camera.getProjectionType() == orv::Camera::ProjectionType::PERSPECTIVE)
        camera.setFieldOfView(fieldOfView);
    camera.setNear(std::max(depth - radius, distance / 100.0f));
    camera.setFar(std::max(depth + radius, distance * 1.01f));
    camera.setPosition(eye);
    orv::point(camera, middle);
}

orv::Ray castThrough(orv::Camera& camera, float x, float y, float width, float height)
{
    Matrix4f projection;
    camera.getProjection(&projection, width / height);
    const Matrix4f toWorld = camera.getWorldTransform() * inverse(projection);
    const float right = 2.0f * x / width - 1.0f;
    const float up = 1.0f - 2.0f * y / height;
    const orv::Vector4f nearPoint = toWorld * orv::Vector4f(right, up, -1.0f, 1.0f);
    const orv::Vector4f farPoint = toWorld * orv::Vector4f(right, up, 1.0f, 1.0f);
    const Vector3f start = nearPoint.xyz() / nearPoint.w;
    return {start, normalize(farPoint.xyz() / farPoint.w - start)};
}

} // namespace view
