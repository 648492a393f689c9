#include "orv/appearance.h"

#include "orv/detail/boundsrevision.h"
#include "orv/propertycollector.h"
#include "orv/rendercontext.h"

namespace orv
{

Appearance::Appearance() : m_stateRevision(detail::nextRevision()), m_propertyRevision(detail::nextRevision())
{
}

Appearance::~Appearance() = default;

void Appearance::setName(const char* name)
{
    m_name = name ? name : "";
}

void Appearance::stateChanged()
{
    m_stateRevision = detail::nextRevision();
    m_opaque = m_forceOpaque ||
               (m_state.blendSrcColour == BlendFactor::ONE && m_state.blendSrcAlpha == BlendFactor::ONE &&
                m_state.blendDstColour == BlendFactor::ZERO && m_state.blendDstAlpha == BlendFactor::ZERO &&
                m_state.blendFunctionColour == BlendFunction::ADD &&
                m_state.blendFunctionAlpha == BlendFunction::ADD);
}

void Appearance::setBlendColour(const Colour4f& colour)
{
    m_state.blendColour = colour;
    stateChanged();
}

void Appearance::setBlendFactors(BlendFactor srcColour, BlendFactor srcAlpha, BlendFactor dstColour,
                                 BlendFactor dstAlpha)
{
    m_state.blendSrcColour = srcColour;
    m_state.blendSrcAlpha = srcAlpha;
    m_state.blendDstColour = dstColour;
    m_state.blendDstAlpha = dstAlpha;
    stateChanged();
}

void Appearance::setBlendFunctions(BlendFunction colour, BlendFunction alpha)
{
    m_state.blendFunctionColour = colour;
    m_state.blendFunctionAlpha = alpha;
    stateChanged();
}

void Appearance::setForceOpaque(bool force)
{
    m_forceOpaque = force;
    stateChanged();
}

void Appearance::setCullingMode(CullingMode mode)
{
    m_state.cullingMode = mode;
    stateChanged();
}

void Appearance::setWindingOrder(WindingOrder order)
{
    m_state.windingOrder = order;
    stateChanged();
}

void Appearance::setLineWidth(float width)
{
    if (!detail::allowLineWidth(width))
        return;
    m_state.lineWidth = width;
    stateChanged();
}

void Appearance::setColourMask(bool red, bool green, bool blue, bool alpha)
{
    m_state.colourMaskRed = red;
    m_state.colourMaskGreen = green;
    m_state.colourMaskBlue = blue;
    m_state.colourMaskAlpha = alpha;
    stateChanged();
}

void Appearance::setDepthWriteEnabled(bool enabled)
{
    m_state.depthWriteEnabled = enabled;
    stateChanged();
}

void Appearance::setDepthOffset(float factor, float units)
{
    if (!detail::allowNumbers("Depth offset", factor, units))
        return;
    m_state.depthOffsetFactor = factor;
    m_state.depthOffsetUnits = units;
    stateChanged();
}

void Appearance::setDepthTestEnabled(bool enabled)
{
    m_state.depthTestEnabled = enabled;
    stateChanged();
}

void Appearance::setDepthTestFunction(DepthFunction function)
{
    m_state.depthFunction = function;
    stateChanged();
}

void Appearance::setScissorTestEnabled(bool enabled)
{
    m_state.scissorTestEnabled = enabled;
    stateChanged();
}

void Appearance::setScissorBox(int x, int y, int width, int height)
{
    if (!detail::allowSize("Scissor box", width, height))
        return;
    m_state.scissorX = x;
    m_state.scissorY = y;
    m_state.scissorWidth = width;
    m_state.scissorHeight = height;
    stateChanged();
}

void Appearance::setStencilTestEnabled(bool enabled)
{
    m_state.stencilTestEnabled = enabled;
    stateChanged();
}

bool Appearance::faceAllowed(StencilFace face)
{
    if (face == StencilFace::BACK || face == StencilFace::FRONT)
        return true;
    ORV_LOG_ERROR("Invalid stencil face %d", int(face));
    return false;
}

void Appearance::setStencilFunction(StencilFace face, StencilFunction function, int reference,
                                    unsigned int mask)
{
    if (!faceAllowed(face))
        return;
    m_state.stencilFunction[int(face)] = function;
    m_state.stencilReference[int(face)] = reference;
    m_state.stencilFunctionMask[int(face)] = mask;
    stateChanged();
}

void Appearance::setStencilOperations(StencilFace face, StencilOperation stencilFail,
                                      StencilOperation depthFail, StencilOperation pass)
{
    if (!faceAllowed(face))
        return;
    m_state.stencilFailOperation[int(face)] = stencilFail;
    m_state.stencilDepthFailOperation[int(face)] = depthFail;
    m_state.stencilPassOperation[int(face)] = pass;
    stateChanged();
}

void Appearance::setStencilMask(StencilFace face, unsigned int mask)
{
    if (!faceAllowed(face))
        return;
    m_state.stencilWriteMask[int(face)] = mask;
    stateChanged();
}

void Appearance::setShaderProgram(const SharedPtr<ShaderProgram>& program)
{
    if (m_shaderProgram == program)
        return;
    m_shaderProgram = program;
    m_linked = false;
    if (program && !program->usesModelTransform())
        detail::boundsChanged();
}

bool Appearance::sizeAllowed(int size)
{
    if (size >= 1)
        return true;
    ORV_LOG_ERROR("Size of property cannot be less than 1.");
    return false;
}

bool Appearance::indexAllowed(const char* name, int index) const
{
    if (index < 0)
    {
        ORV_LOG_ERROR("Property index cannot be less than 0.");
        return false;
    }
    if (index != 0 && !propertyExists(name))
        ORV_LOG_WARN(
            "Property array \"%s[%d]\" value is being set without prior knowledge of the size of the array; "
            "please define size of array explicitly using addProperty() before setting values.",
            name ? name : "", index);
    return true;
}

void Appearance::storeProperty(const char* name, const SharedPtr<ShaderUniformBase>& uniform)
{
    if (!uniform)
        return; // no memory
    m_properties[name ? name : ""] = {uniform, -1};
    m_propertyRevision = detail::nextRevision();
    m_linked = false;
}

const SharedPtr<ShaderUniformBase>& Appearance::getPropertyUniform(const char* name) const
{
    static const SharedPtr<ShaderUniformBase> NONE;
    const auto found = m_properties.find(name ? name : "");
    return found != m_properties.end() ? found->second.uniform : NONE;
}

bool Appearance::propertyExists(const char* name) const
{
    return m_properties.find(name ? name : "") != m_properties.end();
}

void Appearance::collectProperties(PropertyCollector* collector) const
{
    for (const auto& [name, property] : m_properties)
    {
        if (!collector || !collector->collect(property.uniform, name.c_str(), property.uniformIndex))
            return;
    }
}

void Appearance::linkShaderProgram()
{
    if (m_linked)
        return;
    ORV_ASSERT(m_shaderProgram);
    if (!m_shaderProgram)
        return;

    for (auto& entry : m_properties)
        entry.second.uniformIndex = -1;
    const int count = m_shaderProgram->getUniformCount();
    m_values.assign(std::size_t(count), nullptr);
    for (int i = 0; i < count; ++i)
    {
        const auto found = m_properties.find(m_shaderProgram->getUniformPropertyName(i));
        if (found == m_properties.end())
            continue;
        found->second.uniformIndex = i;
        m_values[std::size_t(i)] = found->second.uniform.get(); // several uniforms may share it
    }
    m_sources.revision = 0;
    m_linked = true;
}

void Appearance::applyProperties()
{
    for (const auto& entry : m_properties)
    {
        if (m_shaderProgram && entry.second.uniformIndex != -1)
            m_shaderProgram->setUniformPropertyValue(entry.second.uniformIndex, entry.second.uniform);
    }
}

void Appearance::resetProperties()
{
    for (const auto& entry : m_properties)
    {
        if (m_shaderProgram && entry.second.uniformIndex != -1)
            m_shaderProgram->setUniformPropertyValue(entry.second.uniformIndex, {});
    }
}

void Appearance::enableShaderProgram(RenderContext& context)
{
    if (!m_shaderProgram)
        return;
    linkShaderProgram();
    m_shaderProgram->enable(context, m_values.data(), m_sources);
}

void Appearance::enable(RenderContext& context, bool turnWinding)
{
    m_stateRevision = context.apply(m_state, m_stateRevision, !m_opaque, turnWinding);
    enableShaderProgram(context);
}

const detail::UniformSources* Appearance::prepare(RenderContext& context, bool turnWinding)
{
    if (!m_linked || !context.isApplied(m_stateRevision, !m_opaque, turnWinding)) [[unlikely]]
        return applyAndPrepare(context, turnWinding);
    return m_shaderProgram.get()->prepare(context, m_values.data(), m_sources);
}

[[gnu::noinline]] const detail::UniformSources* Appearance::applyAndPrepare(RenderContext& context,
                                                                            bool turnWinding)
{
    m_stateRevision = context.apply(m_state, m_stateRevision, !m_opaque, turnWinding);
    if (!m_shaderProgram)
        return nullptr;
    linkShaderProgram();
    return m_shaderProgram.get()->prepare(context, m_values.data(), m_sources);
}

} // namespace orv
