#pragma once

#include "orv/shape.h"

namespace orv
{

/// The sphere of radius 0.5 about the origin.
class ORV_API Sphere : public Shape
{
public:
    /// Standing where a transform to the world puts it.
    explicit Sphere(const Matrix4f& localToWorld = Matrix4f::IDENTITY) : Shape(localToWorld) {}

    /// Of the two points that the ray's line meets, gives the one nearer to the start of the ray, which may lie
    /// behind it (a negative distance).
    bool localRaycast(float& distance, Vector3f& normal, const Ray& localRay) const override;
};

} // namespace orv
