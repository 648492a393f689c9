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

/// That of visitScene() with flags.
void visitRestricted(SceneNodeVisitor& visitor, SceneNode& node, const FlagMask& renderFlags,
                     const FlagMask& recursiveFlags);

} // namespace detail
} // namespace orv
