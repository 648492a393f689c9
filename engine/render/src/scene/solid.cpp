#include "orv/solid.h"

#include "solidskin.h"

#include "orv/appearance.h"
#include "orv/log.h"
#include "orv/mesh.h"
#include "orv/rendercontext.h"
#include "orv/scenenodevisitor.h"
#include "orv/shaderprogram.h"

#include <algorithm>

namespace orv
{

namespace
{

/// Outside of frames. A function of its own, so that draw() needs no stack for it.
[[gnu::noinline]] void drawAlone(Solid& solid, RenderContext& context, Appearance& appearance)
{
    const RenderContext::DrawScope scope(context);
    solid.draw(context, appearance);
}

bool isMirrored(const Matrix4f& transform)
{
    return determinant(upper3x3(transform)) < 0.0f;
}

} // namespace

Solid::Solid() = default;

Solid::Solid(const SharedPtr<Mesh>& mesh, const SharedPtr<Appearance>& appearance)
    : m_mesh(mesh)
    , m_appearance(appearance)
{
}

Solid::~Solid()
{
    if (!m_hasSkin)
        return;
    for (detail::SolidSkin::Joint& joint : m_extras->skin->joints)
        detail::JointTie::leave(joint.tie);
}

void Solid::accept(SceneNodeVisitor& visitor)
{
    visitor.visit(this);
}

void Solid::setMesh(const SharedPtr<Mesh>& mesh)
{
    m_mesh = mesh;
    forgetReach(this);
}

void Solid::setAppearance(const SharedPtr<Appearance>& appearance)
{
    m_appearance = appearance;
    forgetReach(this);
}

void Solid::setJointsPerVertex(int count)
{
    if (count > MAX_JOINTS_PER_VERTEX)
        ORV_LOG_WARN("%d is greater than the maximum joints per vertex; clamping to %d", count,
                     MAX_JOINTS_PER_VERTEX);
    if (detail::SolidSkin* const skin = makeSkin())
        skin->jointsPerVertex = std::clamp(count, 0, MAX_JOINTS_PER_VERTEX);
}

int Solid::getJointsPerVertex() const
{
    return m_hasSkin ? m_extras->skin->jointsPerVertex : 0;
}

void Solid::setBindShapeTransform(const Matrix4f& transform)
{
    detail::SolidSkin* const skin = makeSkin();
    if (!skin)
        return;
    skin->bindShape = transform;
    skin->bindShapeMirrored = isMirrored(transform);
}

const Matrix4f& Solid::getBindShapeTransform() const
{
    return m_hasSkin ? m_extras->skin->bindShape : Matrix4f::IDENTITY;
}

/// @return null if there is no memory (logged).
detail::SolidSkin* Solid::makeSkin()
{
    Extras* const extras = makeExtras();
    if (!extras)
        return nullptr;
    if (!m_hasSkin)
        extras->skin = std::make_unique<detail::SolidSkin>();
    m_hasSkin = true;
    return extras->skin.get();
}

void Solid::attachJoint(const SharedPtr<SceneNode>& joint, const Matrix4f& inverseBind)
{
    detail::SolidSkin* const skin = makeSkin();
    if (!skin)
        return;
    skin->joints.push_back(
        {joint ? joint->tie() : SharedPtr<detail::JointTie>(), inverseBind, isMirrored(inverseBind)});
    if (getJointCount() == MAX_JOINTS + 1)
        ORV_LOG_ERROR("Solid \"%s\" has more than %d joints; the others have no effect.", getName(),
                      MAX_JOINTS);
    if (getJointCount() == 1)
        countSkinned(1); // last: may destroy a joint above and this solid
}

int Solid::getJointCount() const
{
    return m_hasSkin ? static_cast<int>(m_extras->skin->joints.size()) : 0;
}

Solid::JointAttachment Solid::getJoint(int i) const
{
    const detail::SolidSkin::Joint& joint = m_extras->skin->joints[static_cast<size_t>(i)];
    return {joint.tie ? joint.tie->getNode() : nullptr, joint.inverseBind};
}

Matrix4f Solid::getJointTransform(int i) const
{
    const detail::SolidSkin::Joint& joint = m_extras->skin->joints[static_cast<size_t>(i)];
    return calculateJointTransform(joint.tie ? joint.tie->getNode() : nullptr, joint.inverseBind);
}

Matrix4f Solid::calculateJointTransform(const JointAttachment& attachment) const
{
    return calculateJointTransform(attachment.joint.get(), attachment.inverseBind);
}

Matrix4f Solid::calculateJointTransform(const SceneNode* joint, const Matrix4f& inverseBind) const
{
    if (!joint)
        return getWorldTransform() * getBindShapeTransform();
    return joint->getWorldTransform() * inverseBind * getBindShapeTransform();
}

bool Solid::turnsSkinWinding(const ShaderProgram* program) const
{
    const bool isSkinned = getJointCount() > 0 && program && program->usesJoints();
    return isSkinned ? isSkinMirrored() : getWorldMirrored();
}

/// By the majority of joints: where they disagree, a part of the mesh is inside out anyway.
bool Solid::isSkinMirrored() const
{
    const int count = std::min(getJointCount(), MAX_JOINTS);
    int mirrored = 0;
    for (int i = 0; i < count; ++i)
    {
        const detail::SolidSkin::Joint& joint = m_extras->skin->joints[static_cast<size_t>(i)];
        const SceneNode* node = joint.tie ? joint.tie->getNode() : nullptr;
        mirrored += (node ? node->getWorldMirrored() != joint.bindMirrored : getWorldMirrored()) ? 1 : 0;
    }
    return (2 * mirrored > count) != m_extras->skin->bindShapeMirrored;
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
    if (!context.isDrawScopeOpen()) [[unlikely]]
        return drawAlone(*this, context, appearance);
    ShaderProgram* program = appearance.getShaderProgram().get();
    if (!program)
        program = ShaderProgram::getCurrent(context);
    appearance.enable(context, turnsWinding(program));
    if (program)
        bindMesh(context, *program).issue();
}

detail::DrawCall Solid::bindMesh(RenderContext& context, ShaderProgram& program) const
{
    VertexBuffer* const vertices = m_mesh->getVertexBuffer().get();
    IndexBuffer* const indices = m_mesh->getIndexBuffer().get();
    if (!vertices || !indices)
        return {};
    if (!context.getBindings().isVertexInputBound(program.getRevision(), vertices->getRevision()))
    {
        // After a lost context, drawing would read garbage.
        if (!program.getId() || vertices->isLost())
            return {};
        program.bind(context, *vertices);
    }
    return indices->bind(context);
}

} // namespace orv
