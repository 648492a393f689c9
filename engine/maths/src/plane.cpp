#include "orv/plane.h"

#include "orv/ray.h"

namespace orv
{

bool Plane::localRaycast(float& distance, Vector3f& normal, const Ray& localRay) const
{
    static constexpr float PARALLEL = 1e-6f;
    if (!(std::fabs(localRay.direction.z) >= PARALLEL))
        return false;

    distance = -localRay.position.z / localRay.direction.z;
    normal = Vector3f::Z_AXIS;
    return true;
}

} // namespace orv
