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
/// at visit(SceneNode*) as well. Pointers are borrowed and never null. A visitor does not change the tree
/// that is being walked.
class ORV_API SceneNodeVisitor
{
public:
    virtual ~SceneNodeVisitor() = default;

    virtual void visit(SceneNode* node);
    virtual void visit(Solid* solid);
    virtual void visit(Camera* camera);
    virtual void visit(Light* light);
};

} // namespace orv
