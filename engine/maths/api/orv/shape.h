#pragma once

#include "orv/export.h"
#include "orv/matrix.h"
#include "orv/shared.h"
#include "orv/vector.h"

namespace orv
{

struct Ray;

/// What a ray met. All zero on a miss.
struct RaycastResult
{
    bool hit = false;      ///< Whether the ray meets the shape.
    float distance = 0.0f; ///< World units along the ray; negative behind its start.
    Vector3f normal;       ///< Unit length, in world space.
};

/// Something simple that a ray can be cast against: an unmoving form in its local space and the transform that
/// carries it into the world.
class ORV_API Shape : public Shared
{
public:
    ORV_CLASS_NAME("Shape")

    /// In local space.
    /// @param distance, normal  written on a hit only.
    /// @param localRay  with a direction of unit length, in whose units the distance is.
    virtual bool localRaycast(float& distance, Vector3f& normal, const Ray& localRay) const = 0;

    /// A ray without direction, or a shape whose transform cannot be inverted, meets nothing.
    RaycastResult raycast(const Ray& worldRay) const;

    const Matrix4f& getTransform() const { return m_transform; } ///< From the shape's space to the world.
    void setTransform(const Matrix4f& localToWorld) { m_transform = localToWorld; }

protected:
    /// Standing where a transform to the world puts it.
    explicit Shape(const Matrix4f& localToWorld) : m_transform(localToWorld) {}

private:
    Matrix4f m_transform;
};

} // namespace orv
