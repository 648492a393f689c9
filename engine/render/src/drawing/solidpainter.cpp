#include "solidpainter.h"

#include "rendererproperties.h"

#include "orv/appearance.h"
#include "orv/mesh.h"
#include "orv/shaderprogram.h"
#include "orv/solid.h"

namespace orv::detail
{

SolidPainter::SolidPainter(RenderContext& context, const RendererProperties& properties, const Matrix4f& view,
                           const Matrix4f& projection)
    : m_context(context)
    , m_properties(properties)
    , m_view(view)
    , m_projection(projection)
    , m_modelProjection(view, projection)
    , m_hadJoints(properties.joints.count->get() > 0)
{
}

void SolidPainter::draw(Solid* const* solids, size_t count)
{
    for (Solid* const* next = solids; next != solids + count; ++next)
    {
        const Solid& solid = **next;
        const bool isReady = solid.getAppearance().get() == m_material && m_revision == g_lastRevision &&
                             !solid.hasSkin() && solid.getWorldMirrored() == m_turnsWinding;
        if (!isReady && !takeMaterial(solid))
            continue;
        if (solid.getMesh().get() != m_mesh && !takeMesh(solid))
            continue;
        sendTransforms(solid);
        m_call.issue();
    }
    if (count > 0)
        publishTransforms(*solids[count - 1]);
}

/// @return false if there is nothing to draw with.
bool SolidPainter::takeMaterial(const Solid& solid)
{
    if (solid.hasSkin() || m_hadJoints)
        publishJoints(solid);
    Appearance* const material = solid.getAppearance().get();
    const ShaderProgram* const program = material ? material->getShaderProgram().get() : nullptr;
    if (!program || !solid.getMesh())
        return false; // taken away by a node of the program's own that was visited later
    if (program != m_program || m_revision != g_lastRevision)
        m_mesh = nullptr;
    m_program = program;

    m_turnsWinding = solid.turnsWinding(program);
    m_sources = material->prepare(m_context, m_turnsWinding);
    m_material = m_sources && !m_hadJoints ? static_cast<const void*>(material) : this;
    if (m_sources && m_sources->readsTransforms) [[unlikely]]
    {
        publishTransforms(solid);
        m_sources = material->prepare(m_context, m_turnsWinding);
        m_material = this;
    }
    if (m_sources && m_sources->transforms[int(DrawTransform::OLD_MODEL_VIEW_PROJECTION)])
        ShaderProgram::sendHeldTransform(*m_sources, DrawTransform::OLD_MODEL_VIEW_PROJECTION); // not ours
    m_revision = g_lastRevision;
    return m_sources != nullptr;
}

void SolidPainter::publishJoints(const Solid& solid)
{
    const bool hasJoints = solid.getJointCount() > 0;
    if (hasJoints || m_hadJoints)
        m_properties.joints.publish(solid);
    m_hadJoints = hasJoints;
}

/// @return false if there is nothing to draw.
bool SolidPainter::takeMesh(const Solid& solid)
{
    m_mesh = solid.getMesh().get();
    m_call = m_mesh ? solid.bindMesh(m_context, *solid.getAppearance()->getShaderProgram()) : DrawCall();
    return m_mesh != nullptr;
}

[[gnu::always_inline]] inline void SolidPainter::sendTransforms(const Solid& solid) const
{
    DrawnUniform* const* const uniforms = m_sources->transforms;
    if (DrawnUniform* uniform = uniforms[int(DrawTransform::MODEL_VIEW_PROJECTION)])
        ShaderProgram::sendTransform(*uniform, project(solid));
    if (DrawnUniform* uniform = uniforms[int(DrawTransform::NORMAL_MODEL)])
        ShaderProgram::sendTransform(*uniform, solid.getNormalTransform());
    if (DrawnUniform* uniform = uniforms[int(DrawTransform::MODEL)])
        ShaderProgram::sendTransform(*uniform, solid.getWorldTransform());
    if (DrawnUniform* uniform = uniforms[int(DrawTransform::MODEL_VIEW)])
        ShaderProgram::sendTransform(*uniform, place(solid));
}

void SolidPainter::publishTransforms(const Solid& solid) const
{
    m_properties.publish(solid, place(solid), project(solid));
}

/// View * the solid's world transform.
Matrix4f SolidPainter::place(const Solid& solid) const
{
    return m_view * solid.getWorldTransform();
}

/// Projection * (view * the solid's world transform): this order keeps precision far from the origin and near the eye.
[[gnu::always_inline]] inline Matrix4f SolidPainter::project(const Solid& solid) const
{
    const Matrix4f& world = solid.getWorldTransform();
    if (m_modelProjection.isUsable() && (solid.isWorldRigid() || isAffine(world))) [[likely]]
        return m_modelProjection.multiply(world);
    return m_projection * (m_view * world);
}

} // namespace orv::detail
