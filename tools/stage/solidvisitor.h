#pragma once

#include "orv/scenenodevisitor.h"
#include "orv/sceneutil.h"
#include "orv/solid.h"

namespace view
{

/// Calls an operation with every solid of a tree, as Solid&.
template <class Operation>
void forEachSolid(orv::SceneNode& scene, const Operation& operation)
{
    class Visitor : public orv::SceneNodeVisitor
    {
    public:
        explicit Visitor(const Operation& wanted) : m_operation(wanted) {}

        using orv::SceneNodeVisitor::visit;
        void visit(orv::Solid* solid) override { m_operation(*solid); }

    private:
        const Operation& m_operation;
    };
    Visitor visitor(operation);
    orv::visitScene(visitor, scene);
}

} // namespace view
