// The draw path of ShaderProgram; the rest of the class is in shaderprogram.cpp.

#include "shaderprogramdraw.h"

#include "shaderuniformprivate.h"

#include "orv/rendercontext.h"
#include "orv/shaderprogram.h"
#include "orv/vertexbuffer.h"

namespace orv
{

int detail::g_boundAttribCount = 0;

void ShaderProgram::link(RenderContext& context)
{
    // Property revisions are unique, so they identify the context as well.
    if (m_linkedRevision != context.getPropertyRevision()) [[unlikely]]
        linkAnew(context);
}

namespace
{

void lookUpNames(detail::UniformSources& sources)
{
    for (detail::UniformSources::Unit& unit : sources.units)
        unit.name = unit.source ? detail::getTextureName(*unit.source, unit.target) : 0;
    sources.readyRevision = detail::g_lastRevision;
}

} // namespace

/// Usually a colour, the most common change of a material.
inline void ShaderProgram::sendVector(const detail::UniformSources::Value& value)
{
    const Vector4f& now = *static_cast<const ShaderUniform<Vector4f>*>(value.source)->values();
    if (*value.sentVector == now)
        return;
    *value.sentVector = now;
    ShaderUniformPrivate::setUniform(value.uniform->location, -1, 1, &now);
}

inline void ShaderProgram::sendIfNew(const detail::UniformSources::Value& value)
{
    detail::DrawnUniform& uniform = *value.uniform;
    if (uniform.sentRevision == value.source->getRevision())
        return;
    uniform.sentRevision = value.source->getRevision();
    if (value.sentVector) [[likely]]
        return sendVector(value);
    ShaderUniformBase& sent = *uniform.sent.get();
    if (sent.takeOver(*value.source))
        sent.send(uniform.location, uniform.textureUnit);
}

const detail::UniformSources* ShaderProgram::prepare(RenderContext& context,
                                                     const ShaderUniformBase* const* values,
                                                     detail::UniformSources& sources)
{
    if (!isReady(context, sources) && !makeReady(context, values, sources))
        return nullptr;
    const detail::UniformSources::Value* own = sources.values.data();
    for (const detail::UniformSources::Value* const end = own + sources.ownCount; own != end; ++own)
        sendIfNew(*own);
    detail::Bindings& bindings = context.getBindings();
    for (const detail::UniformSources::Unit& unit : sources.units)
        bindings.bindNextTexture(unit.unit, unit.target, unit.name, unit.slot);
    return &sources;
}

/// Whether the program is current and nothing has changed since all values were sent, but for what a material has of
/// its own. Every change is a new last revision, those of the program's sources and of bindings as well.
inline bool ShaderProgram::isReady(const RenderContext& context, const detail::UniformSources& sources) const
{
    return context.getBindings().isProgramReady(m_revision) && m_readyRevision == detail::g_lastRevision &&
           m_readyUniforms == sources.ownUniforms && sources.readyRevision == detail::g_lastRevision;
}

[[gnu::noinline]] bool ShaderProgram::makeReady(RenderContext& context,
                                                const ShaderUniformBase* const* values,
                                                detail::UniformSources& sources)
{
    const unsigned program = getId();
    if (!program)
        return false;
    detail::Bindings& bindings = context.getBindings();
    bindings.useProgram(program);
    bindings.setCurrentProgram(m_handle);
    if (bindings.isScopeOpen()) // outside, the application may change bindings in between
        bindings.setProgramReady(m_revision);
    link(context);
    if (sources.revision != m_sourcesRevision)
        resolve(values, sources);
    for (std::size_t i = sources.ownCount; i < sources.values.size(); ++i)
        sendIfNew(sources.values[i]);
    if (sources.readyRevision != detail::g_lastRevision)
        lookUpNames(sources);
    m_readyRevision = detail::g_lastRevision;
    m_readyUniforms = sources.ownUniforms;
    return true;
}

void ShaderProgram::enable(RenderContext& context, const ShaderUniformBase* const* values,
                           detail::UniformSources& sources)
{
    if (!prepare(context, values, sources))
        return;
    for (int i = 0; i < detail::DRAW_TRANSFORM_COUNT; ++i)
        sendHeldTransform(sources, detail::DrawTransform(i));
}

void ShaderProgram::sendHeldTransform(const detail::UniformSources& sources, detail::DrawTransform transform)
{
    detail::DrawnUniform* const uniform = sources.transforms[int(transform)];
    if (!uniform)
        return;
    uniform->sentRevision = 0;
    ShaderUniformBase& sent = *uniform->sent.get();
    if (sent.takeOver(*sources.transformSources[int(transform)]))
        sent.send(uniform->location, -1);
}

void ShaderProgram::sendTransform(detail::DrawnUniform& uniform, const Matrix4f& matrix)
{
    Matrix4f& sent = *static_cast<ShaderUniform<Matrix4f>&>(*uniform.sent.get()).values();
    // The translation first: it differs most often.
    if (sent.columns[3] == matrix.columns[3] && sent == matrix)
        return;
    sent = matrix;
    uniform.sentRevision = 0;
    ShaderUniformPrivate::setUniform(uniform.location, -1, 1, &sent);
}

void ShaderProgram::sendTransform(detail::DrawnUniform& uniform, const Matrix3f& matrix)
{
    Matrix3f& sent = *static_cast<ShaderUniform<Matrix3f>&>(*uniform.sent.get()).values();
    if (sent == matrix)
        return;
    sent = matrix;
    uniform.sentRevision = 0;
    ShaderUniformPrivate::setUniform(uniform.location, -1, 1, &sent);
}

void ShaderProgram::bind(RenderContext& context, VertexBuffer& buffer)
{
    if (!getId())
        return;
    buffer.bindAttribs(context, m_revision, m_attribs.data(), int(m_attribs.size()));
    detail::g_boundAttribCount = int(m_attribs.size());
}

} // namespace orv
