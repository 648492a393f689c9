#pragma once

#include "orv/scenenode.h"
#include "orv/sharedptr.h"

#include <vector>

namespace orv
{

class SceneNodeVisitor;

namespace detail
{

/// A walk through a scene by this thread. Nodes that leave their parents meanwhile, and the top of the walk, live
/// until its end, so that a visitor may remove what it visits. Of walks within one another the outermost counts.
class SceneWalk
{
public:
    explicit SceneWalk(SceneNode& top);
    ~SceneWalk();
    SceneWalk(const SceneWalk&) = delete;
    SceneWalk& operator=(const SceneWalk&) = delete;

    /// For a node that leaves its parent; keeps it if there is a walk.
    static void keep(const SharedPtr<SceneNode>& node);

private:
    bool m_isOutermost;
    SharedPtr<SceneNode> m_top; ///< unless it is no node of SharedPtrs
    std::vector<SharedPtr<SceneNode>> m_kept;
};

/// The walk of all nodes without a look at flags.
void visitAll(SceneNodeVisitor& visitor, SceneNode& node);

/// @param visit  called with each child that is there at first and at its turn; may change the children.
template <class Visit>
void visitChildren(const SceneNode& node, const Visit& visit)
{
    if (!node.getChildList())
        return;
    ChildList::Cursor children(*node.getChildList());
    while (SceneNode* child = children.next())
        visit(*child);
}

} // namespace detail
} // namespace orv
