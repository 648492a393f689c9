#include "scenebounds.h"

#include "orv/indexbuffer.h"
#include "orv/mesh.h"
#include "orv/scenenodevisitor.h"
#include "orv/sceneutil.h"
#include "orv/solid.h"

#include <algorithm>
#include <cmath>

using orv::Matrix4f;
using orv::Vector3f;

namespace
{

/// Calls an operation with every solid of a tree.
template <class Operation>
class SolidVisitor : public orv::SceneNodeVisitor
{
public:
    explicit SolidVisitor(const Operation& operation) : m_operation(operation) {}

    using orv::SceneNodeVisitor::visit;
    void visit(orv::Solid* solid) override { m_operation(*solid); }

private:
    const Operation& m_operation;
};

template <class Operation>
void forEachSolid(orv::SceneNode& scene, const Operation& operation)
{
    SolidVisitor<Operation> visitor(operation);
    orv::visitScene(visitor, scene);
}

/// The box around the sphere about the origin after a transform.
void addSphere(SceneBounds& bounds, const Matrix4f& toWorld, float radius)
{
    const Vector3f centre = toWorld[3].xyz();
    float scale = 0.0f;
    for (int axis = 0; axis < 3; ++axis)
        scale = std::max(scale, length(toWorld[axis].xyz()));
    const float reach = std::max(radius, 0.0f) * scale;
    if (!std::isfinite(reach + centre.x + centre.y + centre.z))
        return;

    for (int axis = 0; axis < 3; ++axis)
    {
        const float low = centre[axis] - reach;
        const float high = centre[axis] + reach;
        bounds.lowest[axis] = bounds.solids ? std::min(bounds.lowest[axis], low) : low;
        bounds.highest[axis] = bounds.solids ? std::max(bounds.highest[axis], high) : high;
    }
    ++bounds.solids;
}

} // namespace

void SceneBounds::add(orv::SceneNode& scene)
{
    forEachSolid(scene,
                 [this](orv::Solid& solid)
                 {
                     if (!solid.getMesh())
                         return;
                     const float radius = solid.getMesh()->getHeader().boundingRadius;
                     if (solid.getJointCount() == 0)
                         addSphere(*this, solid.getWorldTransform(), radius);
                     for (int i = 0; i < solid.getJointCount(); ++i)
                         addSphere(*this, solid.getJointTransform(i), radius);
                 });
}

float SceneBounds::radius() const
{
    return length(highest - lowest) * 0.5f;
}

SceneSize measureScene(orv::SceneNode& scene)
{
    SceneSize size;
    forEachSolid(scene,
                 [&size](orv::Solid& solid)
                 {
                     ++size.solids;
                     if (solid.getMesh() && solid.getMesh()->getIndexBuffer())
                         size.triangles += std::max(getTriangleCount(*solid.getMesh()->getIndexBuffer()), 0);
                 });
    return size;
}
