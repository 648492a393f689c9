// Bounding spheres of subtrees, for culling.

#include "orv/appearance.h"
#include "orv/camera.h"
#include "orv/detail/boundsrevision.h"
#include "orv/mesh.h"
#include "orv/shaderprogram.h"
#include "orv/solid.h"

#include <algorithm>
#include <cmath>
#include <limits>

namespace orv
{

namespace
{

// A sphere's w is its negative radius: above 0 it is empty, at minus infinity unlimited.
constexpr Vector4f NOTHING(0.0f, 0.0f, 0.0f, 1.0f);
constexpr Vector4f UNLIMITED(0.0f, 0.0f, 0.0f, -std::numeric_limits<float>::infinity());

Vector4f placeSphere(const Vector4f& sphere, const Matrix4f& transform)
{
    constexpr float ROUNDING = 1.00001f;
    if (sphere.w > 0.0f)
        return sphere;
    return Vector4f((transform * Vector4f(sphere.xyz(), 1.0f)).xyz(),
                    sphere.w * detail::getStretch(transform) * ROUNDING);
}

void addSphere(Box& box, const Vector4f& sphere)
{
    if (sphere.w > 0.0f)
        return;
    const Vector3f corner(sphere.w, sphere.w, sphere.w);
    box.add(sphere.xyz() + corner);
    box.add(sphere.xyz() - corner);
}

/// About the box's centre.
void growSphere(Vector4f& reach, const Vector4f& sphere)
{
    if (sphere.w > 0.0f)
        return;
    reach.w = std::min(reach.w, sphere.w - length(sphere.xyz() - reach.xyz()));
}

} // namespace

Vector4f SceneNode::getReach() const
{
    if (m_skinnedCount > 0)
        return UNLIMITED;
    if (m_reachState == ReachState::KNOWN && m_extras && m_extras->reachRevision == detail::g_boundsRevision)
        return m_extras->reach;
    if (m_reachState != ReachState::UNKNOWN)
        return findReach();
    m_reachState = ReachState::STEADY;
    return UNLIMITED;
}

/// Calls use with a sphere around what this node draws, and with those around its children's subtrees.
template <class Use>
void SceneNode::forEachReach(const Use& use) const
{
    use(getOwnReach());
    detail::ChildList::Cursor children(*m_children);
    while (const SceneNode* child = children.next())
    {
        const bool isKnown = child->m_reachState == ReachState::KNOWN && child->m_extras &&
                             child->m_extras->reachRevision == detail::g_boundsRevision;
        const Vector4f reach = isKnown ? child->m_extras->reach : child->findReach();
        use(placeSphere(reach, child->getLocalTransform()));
    }
}

/// Visits the children twice; their own subtrees are cached the first time.
Vector4f SceneNode::findReach() const
{
    m_reachState = ReachState::KNOWN;
    if (!m_children)
        return getOwnReach();
    Extras* const extras = makeExtras();
    if (!extras)
        return UNLIMITED;

    extras->reachSolids = getNodeType() == Solid::NODE_TYPE ? 1 : 0;
    Box box;
    bool isLimited = true;
    forEachReach(
        [&](const Vector4f& sphere)
        {
            isLimited = isLimited && std::isfinite(sphere.x + sphere.y + sphere.z + sphere.w);
            addSphere(box, sphere);
        });
    extras->reach = !isLimited ? UNLIMITED : box.isEmpty() ? NOTHING : Vector4f(box.getCentre(), 0.0f);
    detail::ChildList::Cursor children(*m_children);
    while (const SceneNode* child = children.next())
        extras->reachSolids += child->m_children                          ? child->countReach()
                               : child->getNodeType() == Solid::NODE_TYPE ? 1
                                                                          : 0;
    if (isLimited)
        forEachReach([&](const Vector4f& sphere) { growSphere(extras->reach, sphere); });
    extras->reachRevision = detail::g_boundsRevision;
    return extras->reach;
}

/// Unlimited for lights, which shine from outside the view, and for other classes, which may pass anything to a
/// visitor.
Vector4f SceneNode::getOwnReach() const
{
    switch (getNodeType())
    {
    case SceneNode::NODE_TYPE:
    case Camera::NODE_TYPE: return NOTHING;
    case Solid::NODE_TYPE: break;
    default: return UNLIMITED;
    }
    const Solid& solid = static_cast<const Solid&>(*this);
    const Appearance* const appearance = solid.getAppearance().get();
    const ShaderProgram* const program = appearance ? appearance->getShaderProgram().get() : nullptr;
    if (!program || !program->usesModelTransform())
        return UNLIMITED;
    return solid.getMesh() ? solid.getMesh()->getSphere() : NOTHING;
}

void SceneNode::forgetReach(const SceneNode* node)
{
    for (; node && node->m_reachState != ReachState::UNKNOWN; node = node->m_parent)
        node->m_reachState = ReachState::UNKNOWN;
}

} // namespace orv
