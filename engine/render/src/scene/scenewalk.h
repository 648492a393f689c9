#pragma once

#include "orv/scenenode.h"
#include "orv/sharedptr.h"

#include <vector>

namespace orv
{

class SceneNodeVisitor;

namespace detail
{

/// A walk through a scene by this thread. Nodes that leave their parents during it, and its top node, live until its
/// end, so that a visitor may remove nodes. Of nested walks the outermost counts.
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
    SharedPtr<SceneNode> m_top; ///< empty if the node is not reference-counted
    std::vector<SharedPtr<SceneNode>> m_kept;
};

/// Chooses the visitors of parts of a scene.
class WalkGuide
{
public:
    explicit WalkGuide(SceneNodeVisitor& visitor) : m_visitor(visitor) {}

    SceneNodeVisitor& getVisitor() const { return m_visitor; }

    /// @param node  one with children.
    /// @return the visitor above, to be asked again for nodes below; another visitor for the whole of this subtree; or null
    /// to leave it out.
    virtual SceneNodeVisitor* choose(const SceneNode& node) = 0;

protected:
    ~WalkGuide() = default;

private:
    SceneNodeVisitor& m_visitor;
};

/// The walk of visitScene() with flags, guided.
void visitGuided(WalkGuide& guide, SceneNode& node, const FlagMask& renderFlags,
                 const FlagMask& recursiveFlags);

/// The walk of all nodes, without checking flags.
void visitAll(SceneNodeVisitor& visitor, SceneNode& node);

/// That of visitScene() with flags.
void visitRestricted(SceneNodeVisitor& visitor, SceneNode& node, const FlagMask& renderFlags,
                     const FlagMask& recursiveFlags);

} // namespace detail
} // namespace orv
