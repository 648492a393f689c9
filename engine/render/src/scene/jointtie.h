#pragma once

#include "orv/scenenode.h"
#include "orv/sharedptr.h"

namespace orv::detail
{

/// Connects a node with the solids that have it as a joint. The node and each attachment hold a share.
///
/// A joint kept alive by a solid must not keep that solid alive, even indirectly. Only solids with joints hold nodes
/// other than their children, so a joint without such a solid at or below it is safe to keep.
class JointTie : public Shared
{
public:
    ORV_CLASS_NAME("JointTie")

    explicit JointTie(SceneNode& node) : m_node(&node) {}

    /// @return null once it is destroyed.
    SceneNode* getNode() const { return m_node; }
    void nodeDestroyed() { m_node = nullptr; }

    /// Keeps the node alive, or stops doing so; then this call may destroy it. No effect on a node that is being
    /// destroyed.
    void keep(bool kept)
    {
        m_kept = kept && m_node->sharedGetCount() > 0 ? SharedPtr<SceneNode>(m_node) : SharedPtr<SceneNode>();
    }

    /// Ends an attachment; after the last one the node is no longer kept alive.
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
