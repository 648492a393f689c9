#pragma once

#include "orv/scenenode.h"
#include "orv/sharedptr.h"

namespace orv::detail
{

/// Between a node and the solids that have it for a joint. The node holds one share of it, each attachment another.
///
/// A joint that a solid keeps alive must not keep that solid alive, by whatever path. Solids with joints are the
/// only nodes that hold others than their children, so a joint without such a solid at or below it is safe to keep.
class JointTie : public Shared
{
public:
    ORV_CLASS_NAME("JointTie")

    explicit JointTie(SceneNode& node) : m_node(&node) {}

    /// @return null once it is destroyed.
    SceneNode* getNode() const { return m_node; }
    void nodeDestroyed() { m_node = nullptr; }

    /// Keeps the node alive from now on, or no longer; then this call may destroy it. A node that is being destroyed
    /// already stays so.
    void keep(bool kept)
    {
        m_kept = kept && m_node->sharedGetCount() > 0 ? SharedPtr<SceneNode>(m_node) : SharedPtr<SceneNode>();
    }

    /// An attachment's end; with the last one the node is kept no longer.
    static void leave(SharedPtr<JointTie>& tie)
    {
        constexpr int NODE_AND_ONE_ATTACHMENT = 2;
        if (tie && tie->sharedGetCount() <= NODE_AND_ONE_ATTACHMENT)
            tie->keep(false);
        tie = nullptr;
    }

private:
    SceneNode* m_node;
    SharedPtr<SceneNode> m_kept;
};

} // namespace orv::detail
