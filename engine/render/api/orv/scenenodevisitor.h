#pragma once

#include "orv/export.h"

namespace orv
{

class Camera;
class Light;
class SceneNode;
class Solid;

/// Receives scene nodes by their class; each overload does nothing until overridden.
///
/// SceneNode::accept() calls the overload of the node's own class only: a Solid arrives at visit(Solid*), not
/// at visit(SceneNode*) as well. Pointers are borrowed and never null.
///
/// A visitor may remove and move nodes, the visited one too: during visitScene(), what leaves its parent stays alive
/// until the walk ends, and is still walked if its turn has begun. The other children of its parent are met as they
/// would have been. What is added to a node whose children are being walked may be met or not.
class ORV_API SceneNodeVisitor
{
public:
    virtual ~SceneNodeVisitor() = default;

    /// One for each kind of node; it does nothing unless it is overridden.
    virtual void visit(SceneNode* node);
    virtual void visit(Solid* solid);
    virtual void visit(Camera* camera);
    virtual void visit(Light* light);
};

} // namespace orv
