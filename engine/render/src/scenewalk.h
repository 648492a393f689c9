#pragma once

#include "orv/scenenode.h"
#include "orv/sharedptr.h"

#include <vector>

namespace orv::detail
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

/// Where to go on among children after visiting the one that was at a place: the next one, whatever was removed.
size_t findNextChild(const std::vector<SharedPtr<SceneNode>>& children, size_t place,
                     const SceneNode* visited);

/// @param visit  called with each child that is there at first and at its turn; may change the children.
template <class Visit>
void visitChildren(const SceneNode& node, const Visit& visit)
{
    const std::vector<SharedPtr<SceneNode>>& children = node.getChildren();
    size_t left = children.size(); // ends the walk of a visitor that moves each child behind the others
    for (size_t i = 0; left > 0 && i < children.size(); --left)
    {
        SceneNode* const child = children[i].get();
        visit(*child);
        const bool stayed = i < children.size() && children[i].get() == child;
        i = stayed ? i + 1 : findNextChild(children, i, child);
    }
}

} // namespace orv::detail
