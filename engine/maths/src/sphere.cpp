#include "orv/sphere.h"

#include "orv/ray.h"

namespace orv
{

bool Sphere::localRaycast(float& distance, Vector3f& normal, const Ray& localRay) const
{
    static constexpr float RADIUS_SQUARED = 0.25f;
    const Vector3f toCentre = -localRay.position;
    const float b = dot(toCentre, localRay.direction);
    const float discriminant = b * b + RADIUS_SQUARED - dot(toCentre, toCentre);
    if (!(discriminant >= 0.0f))
        return false;

    const float root = std::sqrt(discriminant);
    distance = std::fabs(b + root) < std::fabs(b - root) ? b + root : b - root;
    normal = normalize(localRay.direction * distance - toCentre);
    return true;
}

} // namespace orv
