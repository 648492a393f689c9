#include "orv/square.h"

#include "orv/ray.h"

namespace orv
{

bool Square::localRaycast(float& distance, Vector3f& normal, const Ray& localRay) const
{
    float planeDistance = 0.0f;
    Vector3f planeNormal;
    if (!Plane::localRaycast(planeDistance, planeNormal, localRay))
        return false;

    const Vector3f point = localRay.position + localRay.direction * planeDistance;
    if (!(std::fabs(point.x) <= 0.5f && std::fabs(point.y) <= 0.5f))
        return false;

    distance = planeDistance;
    normal = planeNormal;
    return true;
}

} // namespace orv
