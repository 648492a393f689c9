#include "orv/scenenode.h"

#include "jointtie.h"
#include "scenewalk.h"

#include "orv/log.h"
#include "orv/scenenodevisitor.h"

#include <algorithm>
#include <cmath>
#include <cstring>
#include <new>
#include <utility>

namespace orv
{

SceneNode::SceneNode() = default;

SceneNode::SceneNode(const char* name)
{
    setName(name);
}

SceneNode::~SceneNode()
{
    if (m_tie)
        m_tie->nodeDestroyed();

    // Descendants that die with this node are gathered here and die one by one: a chain of nodes as long as
    // a damaged or generated scene likes must not recurse through as many destructors, nor marks.
    std::vector<SharedPtr<SceneNode>> orphans = std::move(m_children);
    for (const SharedPtr<SceneNode>& child : orphans)
        child->m_parent = nullptr;

    while (!orphans.empty())
    {
        const SharedPtr<SceneNode> orphan = std::move(orphans.back());
        orphans.pop_back();
        SceneNode& node = *orphan.get();
        if (node.sharedGetCount() > 1)
        {
            node.onParentDestroyed();
            continue;
        }
        for (SharedPtr<SceneNode>& child : node.m_children)
        {
            child->m_parent = nullptr;
            orphans.push_back(std::move(child));
        }
        node.m_children.clear();
    }
}

void SceneNode::accept(SceneNodeVisitor& visitor)
{
    visitor.visit(this);
}

void SceneNode::setName(const char* name)
{
    m_name = name ? name : "";
}

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

void SceneNode::setLocalTransform(const Matrix4f& transform)
{
    m_localTransform = transform;
    m_localTransformChanged = false;
    m_localRigid = false;
    m_localMirrored = determinant(upper3x3(transform)) < 0.0f;
    setWorldTransformChanged();
}

const Matrix4f& SceneNode::getLocalTransform() const
{
    updateLocal();
    return m_localTransform;
}

bool SceneNode::getLocalMirrored() const
{
    updateLocal();
    return m_localMirrored;
}

void SceneNode::setTransformChanged()
{
    m_localTransformChanged = true;
    setWorldTransformChanged();
}

void SceneNode::setWorldTransformChanged()
{
    if (m_worldTransformChanged)
        return;
    m_worldTransformChanged = true;
    if (!m_children.empty())
        markChildren();
}

[[gnu::noinline]] void SceneNode::markChildren() // most nodes have none
{
    for (const SharedPtr<SceneNode>& child : m_children)
        child->setWorldTransformChanged();
}

void SceneNode::updateLocal() const
{
    if (m_localTransformChanged)
        buildLocal();
}

void SceneNode::buildLocal() const
{
    const Matrix3f rotation = toMatrix3(m_rotation);
    m_localTransform = Matrix4f(Vector4f(rotation.columns[0], 0.0f), Vector4f(rotation.columns[1], 0.0f),
                                Vector4f(rotation.columns[2], 0.0f), Vector4f(m_position, 1.0f));
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

[[gnu::always_inline]] inline void SceneNode::placeBelow(const Matrix4f& parentWorld, bool parentMirrored,
                                                         bool parentRigid) const
{
    if (m_localTransformChanged)
        buildLocal();
    if (m_localRigid)
        detail::multiplyAffine(m_worldTransform, parentWorld, m_localTransform);
    else
        m_worldTransform = parentWorld * m_localTransform;
    m_worldMirrored = parentMirrored != m_localMirrored;
    m_worldRigid = parentRigid && m_localRigid;
    m_worldTransformChanged = false;
    m_normalTransformChanged = true;
}

void SceneNode::updateAll(const Matrix4f& parentWorld, bool parentMirrored) const
{
    placeBelow(parentWorld, parentMirrored, false);
}

void SceneNode::update() const
{
    if (!m_worldTransformChanged)
        return;
    const SceneNode* parent = m_parent;
    if (parent && parent->m_worldTransformChanged)
        parent->update();
    if (parent)
        placeBelow(parent->m_worldTransform, parent->m_worldMirrored, parent->m_worldRigid);
    else
        updateRoot();
}

void SceneNode::updateRoot() const
{
    placeBelow(Matrix4f::IDENTITY, false, true);
}

void SceneNode::updateNormal() const
{
    const Vector3f x = m_worldTransform.columns[0].xyz();
    const Vector3f y = m_worldTransform.columns[1].xyz();
    const Vector3f z = m_worldTransform.columns[2].xyz();
    const Vector3f yz = cross(y, z);
    const float reciprocal = 1.0f / dot(x, yz);
    const float factor = std::isfinite(reciprocal) ? reciprocal : 1.0f;
    m_normalTransform = Matrix3f(yz * factor, cross(z, x) * factor, cross(x, y) * factor);
    m_normalTransformChanged = false;
}

void SceneNode::updateMotionData()
{
    update();
    if (!m_lastWorldTransform)
        m_lastWorldTransform.reset(new (std::nothrow) Matrix4f);
    if (m_lastWorldTransform)
        *m_lastWorldTransform = m_worldTransform;
    else
        detail::logNoMemory(className());
}

void SceneNode::setParent(const SharedPtr<SceneNode>& parent, bool preserveWorldTransform)
{
    if (parent && parent->hasAncestor(this))
        return;

    // The caller's pointer may lie in the child list that is about to change, and the old parent's share of
    // this node may be the last one: both are held until the end.
    const SharedPtr<SceneNode> newParent = parent; // NOLINT(performance-unnecessary-copy-initialization)
    SharedPtr<SceneNode> self;
    const Matrix4f world = getWorldTransform();
    if (m_parent)
        self = m_parent->takeChild(this);
    if (newParent)
        newParent->m_children.emplace_back(this);
    m_parent = newParent.get();

    const Matrix4f toParent = newParent ? inverse(newParent->getWorldTransform()) : Matrix4f::IDENTITY;
    // A parent squeezed flat has no inverse: then no local matrix keeps the node in place.
    if (preserveWorldTransform && !(toParent == Matrix4f()))
        setLocalTransform(toParent * world);
    else
        setTransformChanged();
    if (newParent)
        newParent->countSkinned(m_skinnedCount);
}

void SceneNode::removeChild(const SharedPtr<SceneNode>& child)
{
    const SharedPtr<SceneNode> taken = takeChild(child.get());
    if (taken)
        taken->onParentDestroyed();
}

bool SceneNode::hasAncestor(const SceneNode* node) const
{
    const SceneNode* ancestor = this;
    while (ancestor && ancestor != node)
        ancestor = ancestor->m_parent;
    return ancestor != nullptr;
}

void SceneNode::onParentDestroyed()
{
    m_parent = nullptr;
    setWorldTransformChanged();
}

const SharedPtr<SceneNode>& SceneNode::getChild(unsigned int i) const
{
    static const SharedPtr<SceneNode> none;
    ORV_ASSERT(i < m_children.size());
    return i < m_children.size() ? m_children[i] : none;
}

/// @param Node  SceneNode, const or not.
template <class Node>
static Node* findBelow(Node& node, const char* name)
{
    if (!std::strcmp(node.getName(), name))
        return &node;
    for (const SharedPtr<SceneNode>& child : node.getChildren())
    {
        if (Node* found = findBelow<Node>(*child, name))
            return found;
    }
    return nullptr;
}

SceneNode* SceneNode::find(const char* name)
{
    return name ? findBelow(*this, name) : nullptr;
}

const SceneNode* SceneNode::find(const char* name) const
{
    return name ? findBelow(*this, name) : nullptr;
}

/// @return the share that the child list held; empty when the node is no child of this one.
SharedPtr<SceneNode> SceneNode::takeChild(const SceneNode* child)
{
    auto found = std::find_if(m_children.begin(), m_children.end(),
                              [child](const SharedPtr<SceneNode>& held) { return held.get() == child; });
    if (found == m_children.end())
        return nullptr;
    SharedPtr<SceneNode> taken = std::move(*found);
    for (auto next = found + 1; next != m_children.end(); ++next, ++found)
        found->swap(*next); // erase() would ask of each whether it drops something
    m_children.pop_back();
    detail::SceneWalk::keep(taken);
    countSkinned(0u - child->m_skinnedCount);
    return taken;
}

/// For attachJoint(): the attachment that takes it is one more that may keep this node alive.
SharedPtr<detail::JointTie> SceneNode::tie()
{
    if (!m_tie)
        m_tie = makeShared<detail::JointTie>(*this);
    if (m_tie)
        m_tie->keep(m_skinnedCount == 0);
    return m_tie;
}

/// Adds to the number of solids with joints at or below this node and those above it; less by wrapping round.
void SceneNode::countSkinned(uint32_t more)
{
    for (SceneNode* node = more != 0 ? this : nullptr; node;)
    {
        // A node that its tie alone has kept is a root, and may go here.
        SceneNode* const parent = node->m_parent;
        node->m_skinnedCount += more;
        if (node->m_tie && node->m_tie->sharedGetCount() > 1)
            node->m_tie->keep(node->m_skinnedCount == 0);
        node = parent;
    }
}

} // namespace orv
