#include "orv/shape.h"

#include "orv/ray.h"

namespace orv
{

RaycastResult Shape::raycast(const Ray& worldRay) const
{
    const Ray scaledRay = transform(worldRay, inverse(m_transform));
    const float localLength = length(scaledRay.direction);
    if (!(localLength > 0.0f))
        return RaycastResult();

    float distance = 0.0f;
    Vector3f normal;
    if (!localRaycast(distance, normal, normalize(scaledRay)))
        return RaycastResult();

    return {true, distance / localLength * length(worldRay.direction),
            normalize((m_transform * Vector4f(normal, 0.0f)).xyz())};
}

} // namespace orv
