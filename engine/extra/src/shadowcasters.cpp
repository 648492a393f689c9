#include "shadowcasters.h"

#include "shadowview.h"

#include "orv/mesh.h"
#include "orv/rendercontext.h"
#include "orv/solid.h"
#include "orv/texture2d.h"
#include "orv/vertexbuffer.h"

#include <algorithm>

namespace orv::detail
{

namespace
{

/// Adds a property of one type to a material.
template <class T>
SharedPtr<ShaderUniform<T>> addProperty(Appearance& material, const char* name, int size = 1)
{
    material.addProperty<T>(name, size);
    return SharedPtr<ShaderUniform<T>>(
        static_cast<ShaderUniform<T>*>(material.getPropertyUniform(name).get()));
}

/// Whether a program draws into the world. Others, as for a picture behind a scene, draw onto the screen.
bool drawsIntoWorld(const ShaderProgram& program)
{
    return program.usesModelTransform() || program.usesJoints() ||
           program.uniformExists("T_VIEW_PROJECTION") || program.uniformExists("T_VIEW");
}

template <class T>
bool copyValue(const ShaderUniformBase& from, ShaderUniformBase& to)
{
    T value;
    return from.getValue(value, 0) && to.setValue(value, 0);
}

} // namespace

ShadowCasters::ShadowCasters(const ShadowPrograms& programs) : m_programs(programs) {}

void ShadowCasters::begin(const ShadowView& view)
{
    m_view = &view;
    ++m_frame;
    m_seen = 0;
}

void ShadowCasters::finish()
{
    for (auto i = m_casters.begin(); m_seen < m_casters.size() && i != m_casters.end();)
        i = i->second.frame == m_frame ? std::next(i) : m_casters.erase(i);
}

void ShadowCasters::draw(RenderContext& context, Solid& solid)
{
    if (!solid.getAppearance() || !solid.getMesh())
        return; // taken away by a node of the program's own that was visited later
    Caster& caster = find(*solid.getAppearance());
    if (!caster.material)
        return;
    caster.model->set(solid.getWorldTransform());
    if (caster.joints)
    {
        const int count = std::min(solid.getJointCount(), Solid::MAX_JOINTS);
        caster.jointCount->set(count);
        for (int i = 0; i < count; ++i)
            caster.joints->set(solid.getJointTransform(i), i);
        const VertexBuffer* const vertices = solid.getMesh()->getVertexBuffer().get();
        caster.weightFilled->set(vertices && vertices->lacksLastWeight() ? 1.0f : 0.0f);
    }
    solid.draw(context, *caster.material);
}

/// The caster of a material, updated to its current program, sides and values.
ShadowCasters::Caster& ShadowCasters::find(const Appearance& appearance)
{
    Caster& caster = m_casters[&appearance];
    if (caster.revision != appearance.getPropertyRevision() ||
        caster.program.get() != appearance.getShaderProgram().get())
        make(appearance, caster);
    if (caster.frame == m_frame)
        return caster;
    caster.frame = m_frame;
    ++m_seen;
    if (!caster.material)
        return caster;

    const RenderState& wanted = appearance.getRenderState();
    const RenderState& had = caster.material->getRenderState();
    if (had.cullingMode != wanted.cullingMode)
        caster.material->setCullingMode(wanted.cullingMode);
    if (had.windingOrder != wanted.windingOrder)
        caster.material->setWindingOrder(wanted.windingOrder);
    caster.material->setProperty("S_CLIP", m_view->clip);
    caster.material->setProperty("S_DEPTH", m_view->rows[2]);
    for (const Value& value : caster.values)
        value.copy(*value.from, *value.to);
    return caster;
}

void ShadowCasters::make(const Appearance& appearance, Caster& caster) const
{
    caster = Caster();
    caster.program = appearance.getShaderProgram();
    caster.revision = appearance.getPropertyRevision();
    if (!caster.program || !drawsIntoWorld(*caster.program))
        return;
    const SharedPtr<ShaderProgram> program = m_programs.findDepth(*caster.program);
    auto material = makeShared<Appearance>();
    if (!program || !program->uniformExists("S_CLIP") || !material)
        return;
    material->setShaderProgram(program);
    material->setProperty("S_SPLIT", Vector3f(1.0f, 255.0f, 255.0f * 255.0f));
    material->addProperty<Matrix4f>("S_CLIP", 1);
    material->addProperty<Vector4f>("S_DEPTH", 1);
    caster.model = addProperty<Matrix4f>(*material, "S_MODEL");
    if (program->usesJoints())
    {
        caster.jointCount = addProperty<int>(*material, "J_COUNT");
        caster.joints = addProperty<Matrix4f>(*material, "J_WORLD", Solid::MAX_JOINTS);
        caster.weightFilled = addProperty<float>(*material, "J_WEIGHT_FILLED");
        if (!caster.jointCount || !caster.joints || !caster.weightFilled)
            return;
    }
    if (!caster.model)
        return;
    caster.material = material;
    addValues(appearance, caster);
}

/// Values that the material lacks come from the context.
void ShadowCasters::addValues(const Appearance& appearance, Caster& caster) const
{
    if (!caster.program->uniformExists("M_CUTOFF"))
        return;
    Appearance& material = *caster.material;
    const auto add = [&](const char* name, const SharedPtr<ShaderUniformBase>& to, auto copy)
    {
        if (to)
            caster.values.push_back({appearance.getPropertyUniform(name), to, copy});
    };
    for (const char* name : {"M_CUTOFF", "M_OPACITY"})
    {
        if (appearance.propertyExists(name))
            add(name, addProperty<float>(material, name), &copyValue<float>);
    }
    if (const char* name = "M_UV_OFFSET_SCALE"; appearance.propertyExists(name))
        add(name, addProperty<Vector4f>(material, name), &copyValue<Vector4f>);
    if (const char* name = "M_DIFFUSE_TEXTURE"; appearance.propertyExists(name))
        add(name, addProperty<SharedPtr<Texture2D>>(material, name), &copyValue<SharedPtr<Texture2D>>);
}

} // namespace orv::detail
