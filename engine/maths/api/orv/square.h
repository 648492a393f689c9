#pragma once

#include "orv/plane.h"

namespace orv
{

/// The part of the plane z = 0 within 0.5 of the origin in x and y; hits as Plane does.
class ORV_API Square : public Plane
{
public:
    /// Standing where a transform to the world puts it.
    explicit Square(const Matrix4f& localToWorld = Matrix4f::IDENTITY) : Plane(localToWorld) {}

    bool localRaycast(float& distance, Vector3f& normal, const Ray& localRay) const override;
};

} // namespace orv
