#include "orv/ray.h"

namespace orv
{

Ray transform(const Ray& ray, const Matrix4f& m)
{
    return {(m * Vector4f(ray.position, 1.0f)).xyz(), (m * Vector4f(ray.direction, 0.0f)).xyz()};
}

Ray normalize(const Ray& ray)
{
    return {ray.position, normalize(ray.direction)};
}

} // namespace orv
