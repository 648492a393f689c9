#pragma once

#include "orv/export.h"
#include "orv/matrix.h"
#include "orv/vector.h"

namespace orv
{

/// A starting point and a direction of any length.
struct Ray
{
    Vector3f position;  ///< Where it starts.
    Vector3f direction; ///< Where it goes; of any length.
};

/// The position is transformed as a point, the direction as a vector; there is no division by w.
ORV_API Ray transform(const Ray& ray, const Matrix4f& m);

/// The same position and the direction at unit length; a zero direction stays zero.
ORV_API Ray normalize(const Ray& ray);

} // namespace orv
