#pragma once

#include "orv/detail/childlist.h"
#include "orv/flagmask.h"
#include "orv/matrix.h"
#include "orv/quaternion.h"
#include "orv/shared.h"
#include "orv/sharedptr.h"
#include "orv/vector.h"

#include <cstdint>
#include <limits>
#include <memory>
#include <vector>

namespace orv
{

class SceneNodeVisitor;

namespace detail
{
class JointTie;
struct SolidSkin;
} // namespace detail

/// A place in the scene tree: a local transform, a lazily kept world transform, flags, a name and children.
///
/// Ownership: a node owns its children; the parent is a plain back-pointer that the parent clears when it is
/// destroyed. A child that leaves its parent lives on only if somebody else holds it.
/// Transforms: world = parent's world * local, local = rotation * scale with the position as translation
/// (column vectors, right-handed). Setters only mark; matrices are rebuilt when read, parents first.
/// Depth: walks, marking and updating recurse once per level, so keep a tree below some thousands of levels;
/// destruction does not recurse.
/// Threads: none, one thread at a time.
class ORV_API SceneNode : public Shared
{
public:
    ORV_CLASS_NAME("SceneNode")
    using Ptr = SharedPtr<SceneNode>;

    /// Tells node classes apart; compare with a class's NODE_TYPE.
    using NodeType = uint32_t;
    static constexpr NodeType NODE_TYPE = 0;

    SceneNode();
    explicit SceneNode(const char* name); ///< The name is copied; null counts as empty.
    ~SceneNode() override;

    virtual NodeType getNodeType() const { return NODE_TYPE; } ///< Which of the engine's kinds it is.

    /// Calls the visitor's visit() for this node's own class; children are not walked (see visitScene()).
    virtual void accept(SceneNodeVisitor& visitor);

    const char* getName() const { return m_name ? m_name.get() : ""; } ///< Empty where there is none.
    /// @param name  copied; null counts as empty.
    void setName(const char* name);

    /// Flag bits as stored: wanted state XOR the flag's inverted bit; see FlagMask and setFlags().
    uint32_t getFlags() const { return m_flags; }
    void setFlags(uint32_t storedBits) { m_flags = storedBits; }

    /// The flag that setVisible() is about: bit 31, on by default.
    static constexpr FlagMask VISIBLE{0x80000000u, 0x80000000u};

    /// Hides this node and all below it from the render blocks that were told setRenderFlags(SceneNode::VISIBLE);
    /// others draw it all the same. Nothing but a flag: setFlags(node, VISIBLE, visible).
    void setVisible(bool visible) { m_flags = visible ? m_flags & ~VISIBLE.mask : m_flags | VISIBLE.mask; }
    /// What was set here; getDerivedFlags(node, VISIBLE) asks the nodes above as well.
    bool isVisible() const { return (m_flags & VISIBLE.mask) == 0; }

    const Vector3f& getPosition() const { return m_position; } ///< In the space of the parent.
    const Quaternionf& getRotation() const { return m_rotation; }
    const Vector3f& getScale() const { return m_scale; }

    /// These three do nothing at all, and mark nothing, when the value equals the stored one exactly.
    void setPosition(const Vector3f& position);
    void setRotation(const Quaternionf& rotation);
    void setScale(const Vector3f& scale);

    /// Replaces the local matrix. Position, rotation and scale are not derived from it and keep their values;
    /// changing one of them later rebuilds the matrix from them and discards this one.
    void setLocalTransform(const Matrix4f& transform);

    /// To the parent's space, or to the world; made up to date first.
    const Matrix4f& getLocalTransform() const;
    const Matrix4f& getWorldTransform() const;
    /// Whether the world transform is known to be made of rotations and translations alone.
    bool isWorldRigid() const;
    /// Takes normals to the world: the inverse transpose of the upper 3x3 part of the world transform. Squeezed
    /// flat, a node has no inverse; then its cofactors, which still point the right way.
    Matrix3f getNormalTransform() const;
    bool getLocalMirrored() const; ///< the local transform flips handedness
    bool getWorldMirrored() const; ///< the world transform flips handedness

    /// The world matrix that updateMotionData() saved; identity before the first call.
    const Matrix4f& getLastWorldTransform() const;

    /// Marks the local matrix, and so this subtree's world matrices, for rebuilding.
    void setTransformChanged();
    /// Marks this subtree's world matrices; returns at once when they are marked already.
    void setWorldTransformChanged();

    void updateLocal() const; ///< Works the local transform out if it is out of date.
    /// Brings this node up to date below a parent with the given world transform.
    void updateAll(const Matrix4f& parentWorld, bool parentMirrored) const;
    /// Brings the stale ancestors, from the topmost down, and this node up to date.
    void update() const;
    /// Saves the current world matrix as the last one; once per frame, after drawing.
    void updateMotionData();

    SceneNode* getParent() const { return m_parent; } ///< Null for a root.

    /// Moves the node, last, under another parent. The node may be destroyed by this call when its old parent
    /// alone held it and the new one is empty.
    /// @param parent  empty makes the node a root. The node itself or one of its descendants is refused
    /// silently: nothing happens.
    /// @param preserveWorldTransform  true gives the node the local matrix that keeps it where it is in the
    /// world (position, rotation and scale stay as they were); false makes the local matrix from
    /// position, rotation and scale again.
    void setParent(const SharedPtr<SceneNode>& parent, bool preserveWorldTransform = false);

    /// Makes a child of this node a root and drops this node's share of it; other nodes are left alone.
    void removeChild(const SharedPtr<SceneNode>& child);

    /// True also for the node itself.
    bool hasAncestor(const SceneNode* node) const;

    /// Called by the parent's destructor on a node that lives on: it becomes a root.
    void onParentDestroyed();

    /// Of direct children.
    unsigned int getChildCount() const { return m_children ? m_children->getCount() : 0; }
    /// @return empty, after logging an assertion, for an index beyond the last child.
    const SharedPtr<SceneNode>& getChild(unsigned int i) const;
    /// In the order in which they were added; valid until that changes.
    const std::vector<SharedPtr<SceneNode>>& getChildren() const;

    detail::ChildList* getChildList() const { return m_children.get(); } ///< the walks'; null for most nodes

    /// Draw path, of nodes with children: a sphere in this node's own space around all solids of the subtree, as
    /// Mesh::getSphere() has it. Infinite where the subtree has lights, solids with joints, solids of unknown bounds, or
    /// nodes that have moved since the last call but one.
    ORV_LOCAL Vector4f getReach() const;
    /// The solids inside of the reach that getReach() has told.
    uint32_t countReach() const { return m_extras ? m_extras->reachSolids : 0; }
    /// Draw path: an upper limit of what the world transform does to lengths; infinite if it is not affine.
    float getWorldStretch() const { return isWorldRigid() ? 1.0f : findStretch(); }
    /// The same if it and the world transform are up to date; else NaN.
    float getKnownStretch() const;
    const Matrix4f& peekWorldTransform() const { return m_worldTransform; } ///< perhaps of an earlier place

    /// Depth first, this node before its children, children in order; names compare exactly.
    /// @return borrowed; null when no node of this subtree has the name.
    SceneNode* find(const char* name);
    const SceneNode* find(const char* name) const;

private:
    friend class Solid;
    friend class detail::ChildList;

    /// What few nodes have.
    struct Extras
    {
        SharedPtr<detail::JointTie> tie;         ///< of a joint of solids
        std::unique_ptr<detail::SolidSkin> skin; ///< of a solid with joints
        std::unique_ptr<Matrix4f> lastWorldTransform;
        Matrix3f normalTransform; ///< unless the world transform is rigid
        float stretch = 0.0f;     ///< likewise
        uint32_t known = 0;       ///< of the two above: NORMAL, STRETCH
        uint32_t reachRevision = 0;
        uint32_t reachSolids = 0;
        Vector4f reach; ///< while m_reachState says so
    };

    /// Of the world transform.
    enum class WorldState : uint8_t
    {
        STALE, ///< to be worked out
        PLACED,
        RIGID ///< placed, and known to be made of rotations and translations alone
    };

    static constexpr uint32_t NORMAL = 1;
    static constexpr uint32_t STRETCH = 2;

    /// What is known of the nodes below, and by them: a node's reach is known only where those of all below are.
    enum class ReachState : uint8_t
    {
        UNKNOWN,
        STEADY, ///< nothing has moved since the last time that it was asked for
        KNOWN
    };

    ORV_LOCAL SharedPtr<detail::JointTie> tie();
    ORV_LOCAL void countSkinned(uint32_t more);
    ORV_LOCAL void addChild(SceneNode& child);
    ORV_LOCAL SharedPtr<SceneNode> takeChild(const SceneNode* child);
    ORV_LOCAL void endChildren();
    ORV_LOCAL void buildLocal() const;
    ORV_LOCAL void updateRoot() const;
    ORV_LOCAL void placeRigidly(const Matrix4f& parentWorld) const;
    ORV_LOCAL void placeLocal(const Matrix4f& parentWorld) const;
    ORV_LOCAL void noteParent(bool parentMirrored, bool parentRigid) const;
    ORV_LOCAL Extras* makeExtras() const;
    Matrix3f findNormal() const;
    ORV_LOCAL float findStretch() const;
    ORV_LOCAL void markChildren();
    ORV_LOCAL Vector4f findReach() const;
    ORV_LOCAL Vector4f getOwnReach() const;
    template <class Use>
    ORV_LOCAL void forEachReach(const Use& use) const;

    /// Marks what the nodes above know of this one as out of date.
    ORV_LOCAL void changeKnownPlace();
    /// Of this node and those above it.
    ORV_LOCAL static void forgetReach(const SceneNode* node);

    mutable bool m_localMirrored = false;
    mutable bool m_worldMirrored = false;
    mutable bool m_localTransformChanged = false;
    mutable WorldState m_worldState = WorldState::RIGID;
    mutable bool m_localRigid = true; ///< known to be rotation and translation alone
    bool m_scaled = false;            ///< m_scale is not all 1
    bool m_hasSkin = false;           ///< among the extras
    mutable ReachState m_reachState = ReachState::UNKNOWN;
    uint32_t m_flags = 0;
    uint32_t m_skinnedCount = 0; ///< solids with joints in this subtree, itself included
    uint32_t m_place = 0;        ///< in the parent's list
    Vector3f m_scale{1.0f, 1.0f, 1.0f};
    Quaternionf m_rotation;
    Vector3f m_position;
    mutable Matrix4f m_localTransform = Matrix4f::IDENTITY;
    mutable Matrix4f m_worldTransform = Matrix4f::IDENTITY;
    std::unique_ptr<char[]> m_name;
    mutable std::unique_ptr<Extras> m_extras;
    std::unique_ptr<detail::ChildList> m_children;
    SceneNode* m_parent = nullptr;
};

[[gnu::always_inline]] inline const Matrix4f& SceneNode::getWorldTransform() const
{
    if (m_worldState == WorldState::STALE) [[unlikely]]
        update();
    return m_worldTransform;
}

inline bool SceneNode::isWorldRigid() const
{
    if (m_worldState == WorldState::STALE)
        update();
    return m_worldState == WorldState::RIGID;
}

inline float SceneNode::getKnownStretch() const
{
    if (m_worldState == WorldState::RIGID) [[likely]]
        return 1.0f;
    const bool isKnown = m_extras && m_worldState == WorldState::PLACED && (m_extras->known & STRETCH);
    return isKnown ? m_extras->stretch : std::numeric_limits<float>::quiet_NaN();
}

inline Matrix3f SceneNode::getNormalTransform() const
{
    const Matrix4f& world = getWorldTransform();
    if (m_worldState == WorldState::RIGID)
        return upper3x3(world);
    return findNormal();
}

inline const Matrix4f& SceneNode::getLastWorldTransform() const
{
    return m_extras && m_extras->lastWorldTransform ? *m_extras->lastWorldTransform : Matrix4f::IDENTITY;
}

inline bool SceneNode::getWorldMirrored() const
{
    if (m_worldState == WorldState::STALE)
        update();
    return m_worldMirrored;
}

} // namespace orv
