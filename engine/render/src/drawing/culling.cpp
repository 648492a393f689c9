#include "culling.h"

#include "orv/detail/eyes.h"

#include "orv/appearance.h"
#include "orv/mesh.h"
#include "orv/sceneutil.h"
#include "orv/shaderprogram.h"
#include "orv/solid.h"

#include <algorithm>

namespace orv::detail
{

namespace
{

Vector3f place(const Matrix4f& transform, const Vector4f& sphere)
{
    return (transform * Vector4f(sphere.xyz(), 1.0f)).xyz();
}

const ShaderProgram* getProgram(const Solid& solid)
{
    const Appearance* const appearance = solid.getAppearance().get();
    return appearance ? appearance->getShaderProgram().get() : nullptr;
}

/// Each vertex lies in the convex hull of the positions that its joints give it.
[[gnu::noinline]] bool hidesSkin(const Frustum& frustum, const Solid& solid, const Mesh& mesh)
{
    const int last = std::min(solid.getJointCount(), Solid::MAX_JOINTS) - 1;
    const IndexBuffer* const indices = mesh.getIndexBuffer().get();
    const bool drawsPoints = indices && indices->getPrimitive() == IndexBuffer::Primitive::POINTS;
    const std::vector<Bounds>& bounds = mesh.getJointBounds();
    HullSight sight(frustum);
    for (size_t i = 0; i < bounds.size(); ++i)
    {
        if (!bounds[i].isKnown())
            continue; // no vertex follows it
        const Matrix4f transform = solid.getJointTransform(std::min(int(i), last));
        const Vector4f sphere = Mesh::makeSphere(bounds[i]);
        sight.add(place(transform, sphere), sphere.w * getStretch(transform));
    }
    return !bounds.empty() && !drawsPoints && sight.isHidden();
}

} // namespace

bool hides(const Frustum& frustum, const Solid& solid)
{
    const Mesh* const mesh = solid.getMesh().get();
    const ShaderProgram* const program = getProgram(solid);
    if (!mesh || !program)
        return false;
    if (program->usesJoints() && solid.getJointCount() > 0)
        return hidesSkin(frustum, solid, *mesh);
    const Vector4f& sphere = mesh->getSphere();
    const Vector3f centre = place(solid.getWorldTransform(), sphere);
    return program->usesModelTransform() && frustum.hides(centre, sphere.w * solid.getWorldStretch());
}

Culling::Culling(SceneNodeVisitor& renderer)
    : WalkGuide(static_cast<SceneNodeVisitor&>(*this))
    , m_renderer(renderer)
{
}

void Culling::begin(const Eye* eyes, int eyeCount)
{
    m_count = 0;
    m_eyeCount = eyeCount;
    for (int i = 0; i < eyeCount; ++i)
        m_frustums[i] = Frustum(inverse(eyes[i].world), eyes[i].projection);
}

void Culling::walk(SceneNode& scene, const FlagMask& renderFlags, const FlagMask& recursiveFlags)
{
    if (m_hasMirrors)
        visitScene(m_renderer, scene, renderFlags, recursiveFlags);
    else
        visitGuided(*this, scene, renderFlags, recursiveFlags);
}

bool Culling::finish(bool hasMirrors)
{
    const bool isWhole = m_hasMirrors || !hasMirrors;
    m_hasMirrors = hasMirrors;
    if (!isWhole)
        m_count = 0;
    return isWhole;
}

bool Culling::hides(const Solid& solid, const Matrix4f& view, const Matrix4f& projection)
{
    const bool isOut = detail::hides(Frustum(view, projection), solid);
    m_count += isOut ? 1 : 0;
    return isOut;
}

void Culling::visit(SceneNode* node)
{
    m_renderer.visit(node);
}

void Culling::visit(Camera* camera)
{
    m_renderer.visit(camera);
}

void Culling::visit(Light* light)
{
    m_renderer.visit(light);
}

SceneNodeVisitor* Culling::choose(const SceneNode& node)
{
    const Vector4f reach = node.getReach();
    const Vector3f centre = place(node.getWorldTransform(), reach);
    const float negativeRadius = reach.w * node.getWorldStretch();
    bool isOutside = true;
    bool isInside = true;
    for (int i = 0; i < m_eyeCount; ++i)
    {
        const Frustum::Sight sight = m_frustums[i].look(centre, negativeRadius);
        isOutside = isOutside && sight == Frustum::Sight::OUTSIDE;
        isInside = isInside && sight == Frustum::Sight::INSIDE;
    }
    if (isOutside)
        m_count += uint32_t(m_eyeCount) * node.countReach();
    return isOutside ? nullptr : isInside ? &m_renderer : this;
}

} // namespace orv::detail
