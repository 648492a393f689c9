#include "orv/solid.h"

#include "orv/appearance.h"
#include "orv/log.h"
#include "orv/mesh.h"
#include "orv/rendercontext.h"
#include "orv/scenenodevisitor.h"
#include "orv/shaderprogram.h"

#include <algorithm>

namespace orv
{

Solid::Solid() = default;

Solid::Solid(const SharedPtr<Mesh>& mesh, const SharedPtr<Appearance>& appearance)
    : m_mesh(mesh)
    , m_appearance(appearance)
{
}

Solid::~Solid() = default;

void Solid::accept(SceneNodeVisitor& visitor)
{
    visitor.visit(this);
}

void Solid::setMesh(const SharedPtr<Mesh>& mesh)
{
    m_mesh = mesh;
}

void Solid::setAppearance(const SharedPtr<Appearance>& appearance)
{
    m_appearance = appearance;
}

void Solid::setJointsPerVertex(int count)
{
    if (count > MAX_JOINTS_PER_VERTEX)
        ORV_LOG_WARN("%d is greater than the maximum joints per vertex; clamping to %d", count,
                     MAX_JOINTS_PER_VERTEX);
    makeSkin().jointsPerVertex = std::clamp(count, 0, MAX_JOINTS_PER_VERTEX);
}

Solid::Skin& Solid::makeSkin()
{
    if (!m_skin)
        m_skin = std::make_unique<Skin>();
    return *m_skin;
}

void Solid::attachJoint(const SharedPtr<SceneNode>& joint, const Matrix4f& inverseBind)
{
    JointAttachment attachment;
    attachment.inverseBind = inverseBind;
    if (joint && hasAncestor(joint.get()))
        attachment.above = joint.get();
    else
        attachment.joint = joint;
    makeSkin().joints.push_back(attachment);

    if (getJointCount() == MAX_JOINTS + 1)
        ORV_LOG_ERROR("Solid \"%s\" has more than %d joints; the others have no effect.", getName(),
                      MAX_JOINTS);
}

Matrix4f Solid::calculateJointTransform(const JointAttachment& attachment) const
{
    const SceneNode* joint = attachment.joint.get();
    if (!joint && attachment.above && hasAncestor(attachment.above))
        joint = attachment.above;
    if (!joint)
        return getWorldTransform() * getBindShapeTransform();
    return joint->getWorldTransform() * attachment.inverseBind * getBindShapeTransform();
}

void Solid::draw(RenderContext& context)
{
    if (m_appearance)
        draw(context, *m_appearance);
}

void Solid::draw(RenderContext& context, Appearance& appearance)
{
    if (!m_mesh)
        return;
    appearance.enable(context, getWorldMirrored());

    ShaderProgram* program = appearance.getShaderProgram().get();
    if (!program)
        program = ShaderProgram::getCurrent(context);
    VertexBuffer* vertices = m_mesh->getVertexBuffer().get();
    IndexBuffer* indices = m_mesh->getIndexBuffer().get();
    if (!program || !vertices || !indices)
        return;
    if (!context.isVertexInputBound(program->getRevision(), vertices->getRevision()))
    {
        // Whatever a lost context took along, drawing the rest would read garbage.
        if (!program->getId() || vertices->isLost())
            return;
        program->bind(context, *vertices);
    }
    indices->draw(context);
}

} // namespace orv
