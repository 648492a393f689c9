#include "orv/scenenode.h"

#include "jointtie.h"
#include "scenewalk.h"
#include "solidskin.h"

#include "orv/log.h"
#include "orv/scenenodevisitor.h"

#include <algorithm>
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
    if (m_extras && m_extras->tie)
        m_extras->tie->nodeDestroyed();
    if (m_children)
        endChildren();
}

/// Collects the descendants that die with this node and destroys them one by one: a very long chain of nodes must not
/// recurse through destructors or marks.
void SceneNode::endChildren()
{
    std::vector<SharedPtr<SceneNode>> orphans = m_children->getAll();
    m_children.reset();
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
        const std::unique_ptr<detail::ChildList> children = std::move(node.m_children);
        if (!children)
            continue;
        for (const SharedPtr<SceneNode>& child : children->getAll())
        {
            child->m_parent = nullptr;
            orphans.push_back(child);
        }
    }
}

void SceneNode::accept(SceneNodeVisitor& visitor)
{
    visitor.visit(this);
}

void SceneNode::setName(const char* name)
{
    const size_t length = name ? std::strlen(name) : 0;
    std::unique_ptr<char[]> copy; // name may point into the old one
    if (length > 0)
    {
        copy = std::make_unique<char[]>(length + 1);
        std::memcpy(copy.get(), name, length);
    }
    m_name = std::move(copy);
}

void SceneNode::setLocalTransform(const Matrix4f& transform)
{
    m_localTransform = transform;
    m_localTransformChanged = false;
    m_localRigid = false;
    m_localMirrored = determinant(upper3x3(transform)) < 0.0f;
    forgetReach(m_parent);
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

/// @return null if there is no memory (logged).
SceneNode::Extras* SceneNode::makeExtras() const
{
    if (!m_extras)
        m_extras.reset(new (std::nothrow) Extras);
    if (!m_extras)
        detail::logNoMemory(className());
    return m_extras.get();
}

void SceneNode::updateMotionData()
{
    update();
    Extras* const extras = makeExtras();
    if (!extras)
        return;
    if (!extras->lastWorldTransform)
        extras->lastWorldTransform.reset(new (std::nothrow) Matrix4f);
    if (extras->lastWorldTransform)
        *extras->lastWorldTransform = m_worldTransform;
    else
        detail::logNoMemory(className());
}

void SceneNode::setParent(const SharedPtr<SceneNode>& parent, bool preserveWorldTransform)
{
    // A node without children is no other node's ancestor.
    if (parent && (parent.get() == this || (getChildCount() > 0 && parent->hasAncestor(this))))
        return;

    // The caller's pointer may be in the child list that changes, and the old parent may hold the last share of this
    // node: both are held until the end.
    const SharedPtr<SceneNode> newParent = parent; // NOLINT(performance-unnecessary-copy-initialization)
    SharedPtr<SceneNode> self;
    const Matrix4f world = getWorldTransform();
    if (m_parent)
        self = m_parent->takeChild(this);
    if (newParent)
        newParent->addChild(*this);
    m_parent = newParent.get();

    const Matrix4f toParent =
        newParent && preserveWorldTransform ? inverse(newParent->getWorldTransform()) : Matrix4f::IDENTITY;
    // A flattened parent has no inverse: then no local matrix keeps the node in place.
    if (preserveWorldTransform && !(toParent == Matrix4f()))
        setLocalTransform(toParent * world);
    else
        setTransformChanged();
    if (newParent)
        newParent->countSkinned(m_skinnedCount);
}

void SceneNode::addChild(SceneNode& child)
{
    if (!m_children)
        m_children = std::make_unique<detail::ChildList>();
    m_children->add(child);
    forgetReach(this);
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
    const bool isThere = i < getChildCount();
    if (!isThere)
        ORV_LOG_ERROR("%s", "ORV_ASSERT: i < m_children.size()");
    return isThere ? m_children->get(i) : none;
}

const std::vector<SharedPtr<SceneNode>>& SceneNode::getChildren() const
{
    static const std::vector<SharedPtr<SceneNode>> none;
    return m_children ? m_children->getAll() : none;
}

/// @param Node  SceneNode, const or not.
template <class Node>
static Node* findBelow(Node& node, const char* name)
{
    if (!std::strcmp(node.getName(), name))
        return &node;
    if (!node.getChildList())
        return nullptr;
    detail::ChildList::Cursor children(*node.getChildList());
    while (SceneNode* child = children.next())
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
    if (!child || child->m_parent != this)
        return nullptr;
    SharedPtr<SceneNode> taken = m_children->take(*child);
    forgetReach(this);
    detail::SceneWalk::keep(taken);
    countSkinned(0u - child->m_skinnedCount);
    return taken;
}

/// For attachJoint(): counts one more attachment that may keep this node alive.
SharedPtr<detail::JointTie> SceneNode::tie()
{
    Extras* const extras = makeExtras();
    if (!extras)
        return {};
    if (!extras->tie)
        extras->tie = makeShared<detail::JointTie>(*this);
    if (extras->tie)
        extras->tie->keep(m_skinnedCount == 0);
    return extras->tie;
}

/// Adds to the number of solids with joints at or below this node and its ancestors; wraps round to subtract.
void SceneNode::countSkinned(uint32_t more)
{
    for (SceneNode* node = more != 0 ? this : nullptr; node;)
    {
        // A node kept only by its tie is a root, and may be destroyed here.
        SceneNode* const parent = node->m_parent;
        node->m_skinnedCount += more;
        detail::JointTie* const tie = node->m_extras ? node->m_extras->tie.get() : nullptr;
        if (tie && tie->sharedGetCount() > 1)
            tie->keep(node->m_skinnedCount == 0);
        node = parent;
    }
}

} // namespace orv
