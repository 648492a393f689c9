// World transforms of SceneNode; the rest of the class is in scenenode.cpp.

#include "orv/scenenode.h"

#include "orv/detail/lanes.h"

#include <cmath>

namespace orv
{

void SceneNode::setPosition(const Vector3f& position)
{
    if (position == m_position)
        return;
    m_position = position;
    setTransformChanged();
}

void SceneNode::setRotation(const Quaternionf& rotation)
{
    if (rotation == m_rotation)
        return;
    m_rotation = rotation;
    setTransformChanged();
}

void SceneNode::setScale(const Vector3f& scale)
{
    if (scale == m_scale)
        return;
    m_scale = scale;
    m_scaled = !(scale == Vector3f(1.0f, 1.0f, 1.0f));
    setTransformChanged();
}

void SceneNode::setTransformChanged()
{
    m_localTransformChanged = true;
    if (m_reachState != ReachState::UNKNOWN) [[unlikely]]
        return changeKnownPlace();
    setWorldTransformChanged();
}

[[gnu::noinline]] void SceneNode::changeKnownPlace()
{
    forgetReach(m_parent);
    setWorldTransformChanged();
}

void SceneNode::setWorldTransformChanged()
{
    if (m_worldState == WorldState::STALE)
        return;
    m_worldState = WorldState::STALE;
    if (m_children)
        markChildren();
}

[[gnu::noinline]] void SceneNode::markChildren() // most nodes have none
{
    detail::ChildList::Cursor children(*m_children);
    while (SceneNode* child = children.next())
        child->setWorldTransformChanged();
}

void SceneNode::updateLocal() const
{
    if (m_localTransformChanged)
        buildLocal();
}

void SceneNode::buildLocal() const
{
    detail::store(m_localTransform, detail::makeRigid(m_rotation, m_position));
    m_localMirrored = false;
    m_localRigid = !m_scaled;
    m_localTransformChanged = false;
    if (!m_scaled)
        return;
    m_localTransform.columns[0] *= m_scale.x;
    m_localTransform.columns[1] *= m_scale.y;
    m_localTransform.columns[2] *= m_scale.z;
    m_localMirrored = (m_scale.x < 0.0f) != ((m_scale.y < 0.0f) != (m_scale.z < 0.0f));
}

/// For a node that has moved: multiplies its local transform without storing it in between.
[[gnu::always_inline]] inline void SceneNode::placeRigidly(const Matrix4f& parentWorld) const
{
    const detail::LaneMatrix local = detail::makeRigid(m_rotation, m_position);
    detail::store(m_localTransform, local);
    detail::store(m_worldTransform, detail::multiplyAffine(detail::load(parentWorld), local));
    m_localMirrored = false;
    m_localRigid = true;
    m_localTransformChanged = false;
}

[[gnu::noinline]] void SceneNode::placeLocal(const Matrix4f& parentWorld) const
{
    updateLocal();
    if (m_localRigid)
        detail::store(m_worldTransform,
                      detail::multiplyAffine(detail::load(parentWorld), detail::load(m_localTransform)));
    else
        m_worldTransform = parentWorld * m_localTransform;
}

inline void SceneNode::noteParent(bool parentMirrored, bool parentRigid) const
{
    m_worldMirrored = parentMirrored != m_localMirrored;
    m_worldState = parentRigid && m_localRigid ? WorldState::RIGID : WorldState::PLACED;
    if (m_extras)
        m_extras->known = 0;
}

void SceneNode::updateAll(const Matrix4f& parentWorld, bool parentMirrored) const
{
    placeLocal(parentWorld);
    noteParent(parentMirrored, false);
}

void SceneNode::update() const
{
    if (m_worldState != WorldState::STALE)
        return;
    const SceneNode* parent = m_parent;
    if (!parent)
        return updateRoot();
    if (parent->m_worldState == WorldState::STALE)
        parent->update();
    if (m_localTransformChanged && !m_scaled)
        placeRigidly(parent->m_worldTransform);
    else
        placeLocal(parent->m_worldTransform);
    noteParent(parent->m_worldMirrored, parent->m_worldState == WorldState::RIGID);
}

void SceneNode::updateRoot() const
{
    placeLocal(Matrix4f::IDENTITY);
    noteParent(false, true);
}

/// For a world transform that is not rigid; the update is done.
Matrix3f SceneNode::findNormal() const
{
    Extras* const extras = makeExtras();
    if (extras && (extras->known & NORMAL))
        return extras->normalTransform;
    const Vector3f x = m_worldTransform.columns[0].xyz();
    const Vector3f y = m_worldTransform.columns[1].xyz();
    const Vector3f z = m_worldTransform.columns[2].xyz();
    const Vector3f yz = cross(y, z);
    const float reciprocal = 1.0f / dot(x, yz);
    const float factor = std::isfinite(reciprocal) ? reciprocal : 1.0f;
    const Matrix3f normal(yz * factor, cross(z, x) * factor, cross(x, y) * factor);
    if (extras)
    {
        extras->normalTransform = normal;
        extras->known |= NORMAL;
    }
    return normal;
}

/// For a world transform that is not rigid; the update is done.
float SceneNode::findStretch() const
{
    Extras* const extras = makeExtras();
    if (extras && (extras->known & STRETCH))
        return extras->stretch;
    const float stretch = detail::getStretch(m_worldTransform);
    if (extras)
    {
        extras->stretch = stretch;
        extras->known |= STRETCH;
    }
    return stretch;
}

} // namespace orv
