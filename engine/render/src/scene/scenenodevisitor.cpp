#include "orv/scenenodevisitor.h"

namespace orv
{

void SceneNodeVisitor::visit(SceneNode*) {}

void SceneNodeVisitor::visit(Solid*) {}

void SceneNodeVisitor::visit(Camera*) {}

void SceneNodeVisitor::visit(Light*) {}

} // namespace orv
