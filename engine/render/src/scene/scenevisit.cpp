#include "scenewalk.h"

#include "orv/scenenodevisitor.h"

namespace orv::detail
{

static void visitBelow(SceneNodeVisitor& visitor, ChildList& list)
{
    ChildList::Cursor children(list);
    while (SceneNode* child = children.next())
    {
        child->accept(visitor);
        if (child->getChildList()) // most have none, and need no call
            visitBelow(visitor, *child->getChildList());
    }
}

void visitAll(SceneNodeVisitor& visitor, SceneNode& node)
{
    node.accept(visitor);
    if (node.getChildList())
        visitBelow(visitor, *node.getChildList());
}

} // namespace orv::detail
