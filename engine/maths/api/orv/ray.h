#pragma once

#include "orv/export.h"
#include "orv/matrix.h"
#include "orv/vector.h"

namespace orv
{

/// A starting point and a direction of any length.
struct Ray
{
    Vector3f position;
    Vector3f direction;
};

/// The position is transformed as a point, the direction as a vector; there is no division by w.
ORV_API Ray transform(const Ray& ray, const Matrix4f& m);

/// The same position and the direction at unit length; a zero direction stays zero.
ORV_API Ray normalize(const Ray& ray);

} // namespace orv
