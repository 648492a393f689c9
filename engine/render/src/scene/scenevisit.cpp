#include "scenewalk.h"

#include "orv/scenenodevisitor.h"

namespace orv::detail
{

namespace
{

/// State that the flag-restricted walk passes from a node to its children.
struct WalkState
{
    uint32_t accumulated = 0; ///< the recursive flags met on the way down, in stored polarity
    bool satisfied = false;   ///< whether the recursive condition held at the parent
};

/// Constants of one walk.
struct Walk
{
    SceneNodeVisitor& visitor;
    const FlagMask& renderFlags;
    const FlagMask& recursiveFlags;
    bool plainFlags;  ///< no recursive flag is on by default: once the condition holds, it holds below
    WalkGuide* guide; ///< null where there is none
};

void visitBelow(SceneNodeVisitor& visitor, ChildList& list)
{
    ChildList::Cursor children(list);
    while (SceneNode* child = children.next())
    {
        child->accept(visitor);
        if (child->getChildList()) // most have none
            visitBelow(visitor, *child->getChildList());
    }
}

void visitAllGuided(WalkGuide& guide, SceneNode& node)
{
    SceneNodeVisitor* const visitor = node.getChildList() ? guide.choose(node) : &guide.getVisitor();
    if (!visitor)
        return;
    if (visitor != &guide.getVisitor())
        return visitAll(*visitor, node);
    node.accept(*visitor);
    if (!node.getChildList())
        return;
    ChildList::Cursor children(*node.getChildList());
    while (SceneNode* child = children.next())
    {
        if (child->getChildList())
            visitAllGuided(guide, *child);
        else
            child->accept(*visitor);
    }
}

/// Visits the node, if its flags are right.
/// @return whether to visit its children, with the updated state.
[[gnu::always_inline]] inline bool visitOne(const Walk& walk, SceneNode& node, WalkState& state)
{
    const FlagMask& render = walk.renderFlags;
    const FlagMask& recursive = walk.recursiveFlags;
    state.accumulated |= node.getFlags() & recursive.mask;
    const bool nowSatisfied = ((recursive.inverted ^ state.accumulated) & recursive.mask) == recursive.mask;
    const bool stop = nowSatisfied ? walk.plainFlags : state.satisfied;
    state.satisfied = nowSatisfied;
    if (stop && nowSatisfied)
    {
        if (walk.guide)
            visitAllGuided(*walk.guide, node);
        else
            visitAll(walk.visitor, node);
        return false;
    }

    const uint32_t flags = (node.getFlags() | state.accumulated) ^ render.inverted;
    if ((flags & render.mask) == render.mask)
        node.accept(walk.visitor);
    return !stop; // otherwise no node below can meet the condition again
}

void visitRestrictedBelow(const Walk& walk, ChildList& list, const WalkState& state)
{
    ChildList::Cursor children(list);
    while (SceneNode* child = children.next())
    {
        WalkState childState = state;
        if (visitOne(walk, *child, childState) && child->getChildList())
            visitRestrictedBelow(walk, *child->getChildList(), childState);
    }
}

Walk makeWalk(SceneNodeVisitor& visitor, const FlagMask& renderFlags, const FlagMask& recursiveFlags,
              WalkGuide* guide)
{
    return {visitor, renderFlags, recursiveFlags, (recursiveFlags.mask & recursiveFlags.inverted) == 0,
            guide};
}

void visitRestricted(const Walk& walk, SceneNode& node, WalkState& state)
{
    if (visitOne(walk, node, state) && node.getChildList())
        visitRestrictedBelow(walk, *node.getChildList(), state);
}

void visitRestrictedGuided(const Walk& walk, SceneNode& node, WalkState state)
{
    SceneNodeVisitor* const visitor = node.getChildList() ? walk.guide->choose(node) : &walk.visitor;
    if (!visitor)
        return;
    if (visitor != &walk.visitor)
        return visitRestricted(makeWalk(*visitor, walk.renderFlags, walk.recursiveFlags, nullptr), node,
                               state);
    if (!visitOne(walk, node, state) || !node.getChildList())
        return;
    ChildList::Cursor children(*node.getChildList());
    while (SceneNode* child = children.next())
        visitRestrictedGuided(walk, *child, state);
}

} // namespace

void visitAll(SceneNodeVisitor& visitor, SceneNode& node)
{
    node.accept(visitor);
    if (node.getChildList())
        visitBelow(visitor, *node.getChildList());
}

void visitRestricted(SceneNodeVisitor& visitor, SceneNode& node, const FlagMask& renderFlags,
                     const FlagMask& recursiveFlags)
{
    WalkState state;
    visitRestricted(makeWalk(visitor, renderFlags, recursiveFlags, nullptr), node, state);
}

void visitGuided(WalkGuide& guide, SceneNode& node, const FlagMask& renderFlags,
                 const FlagMask& recursiveFlags)
{
    const SceneWalk walk(node);
    if (renderFlags.mask == 0)
        visitAllGuided(guide, node);
    else
        visitRestrictedGuided(makeWalk(guide.getVisitor(), renderFlags, recursiveFlags, &guide), node, {});
}

} // namespace orv::detail
