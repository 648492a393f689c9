#pragma once

#include "orv/shape.h"

namespace orv
{

/// The endless plane z = 0, normal +z.
class ORV_API Plane : public Shape
{
public:
    /// Standing where a transform to the world puts it.
    explicit Plane(const Matrix4f& localToWorld = Matrix4f::IDENTITY) : Shape(localToWorld) {}

    /// Hits behind the start of the ray count, with a negative distance; who wants forward hits tests the sign.
    bool localRaycast(float& distance, Vector3f& normal, const Ray& localRay) const override;
};

} // namespace orv
