#include "orv/rendercontext.h"

#include "countedgl.h"

#include "orv/detail/revision.h"
#include "orv/log.h"

#include <iterator>

namespace orv
{

namespace
{

// GL's values in the order of the enums, each as long as the table of keywords.

constexpr GLenum GL_BLEND_FACTORS[std::size(BLEND_FACTORS)] = {
    GL_CONSTANT_ALPHA,
    GL_CONSTANT_COLOR,
    GL_DST_ALPHA,
    GL_DST_COLOR,
    GL_ONE,
    GL_ONE_MINUS_CONSTANT_ALPHA,
    GL_ONE_MINUS_CONSTANT_COLOR,
    GL_ONE_MINUS_DST_ALPHA,
    GL_ONE_MINUS_DST_COLOR,
    GL_ONE_MINUS_SRC_ALPHA,
    GL_ONE_MINUS_SRC_COLOR,
    GL_SRC_ALPHA,
    GL_SRC_ALPHA_SATURATE,
    GL_SRC_COLOR,
    GL_ZERO,
};
constexpr GLenum GL_BLEND_FUNCTIONS[std::size(BLEND_FUNCTIONS)] = {GL_FUNC_ADD, GL_FUNC_REVERSE_SUBTRACT,
                                                                   GL_FUNC_SUBTRACT};
/// CULL_NONE has no face: culling is switched off instead.
constexpr GLenum GL_CULLED_FACES[std::size(CULLING_MODES)] = {GL_BACK, GL_FRONT, GL_FRONT_AND_BACK, GL_NONE};
constexpr GLenum GL_WINDING_ORDERS[std::size(WINDING_ORDERS)] = {GL_CCW, GL_CW};
constexpr GLenum GL_COMPARISONS[std::size(COMPARISONS)] = {
    GL_NEVER, GL_LESS, GL_EQUAL, GL_LEQUAL, GL_GREATER, GL_NOTEQUAL, GL_GEQUAL, GL_ALWAYS,
};
constexpr GLenum GL_STENCIL_OPERATIONS[std::size(STENCIL_OPERATIONS)] = {
    GL_ZERO, GL_KEEP, GL_REPLACE, GL_INCR, GL_DECR, GL_INVERT, GL_INCR_WRAP, GL_DECR_WRAP,
};
constexpr GLenum GL_STENCIL_FACES[std::size(STENCIL_FACES)] = {GL_BACK, GL_FRONT};

/// @param what      the enum, for the message.
/// @param function  the name that the message bears.
/// @return the table's value, or GL_INVALID_ENUM (logged) for a value outside of the enum.
template <class Enum, std::size_t N>
GLenum toGL(const GLenum (&table)[N], Enum value, const char* what, const char* function)
{
    const auto index = uint32_t(value);
    if (index < N)
        return table[index];
    detail::logError(detail::sourcePathText<__FILE__>, function, __LINE__, "Invalid %s %d", what, int(value));
    return GL_INVALID_ENUM;
}

void setCapability(GLenum capability, bool enabled)
{
    if (enabled)
        glEnable(capability);
    else
        glDisable(capability);
}

WindingOrder turned(WindingOrder order)
{
    switch (order)
    {
    case WindingOrder::WINDING_CCW: return WindingOrder::WINDING_CW;
    case WindingOrder::WINDING_CW: return WindingOrder::WINDING_CCW;
    default: return order; // outside the enum: reported when it is sent
    }
}

} // namespace

RenderContext::DrawScope::DrawScope(RenderContext& context) : m_context(context)
{
    m_context.m_bindings.openScope();
}

RenderContext::DrawScope::~DrawScope()
{
    m_context.m_bindings.closeScope();
}

RenderContext::RenderContext() : m_revision(detail::nextRevision())
{
    // The differences between a new GL context and a new material.
    m_state.cullingMode = CullingMode::CULL_NONE;
    m_state.depthTestEnabled = false;

    GLint scissor[4] = {0, 0, 0, 0};
    glGetIntegerv(GL_SCISSOR_BOX, scissor);
    m_state.scissorX = scissor[0];
    m_state.scissorY = scissor[1];
    m_state.scissorWidth = scissor[2];
    m_state.scissorHeight = scissor[3];
    glGetIntegerv(GL_VIEWPORT, m_viewport);
}

RenderContext::~RenderContext() = default;

void RenderContext::setBlendEnabled(bool enabled)
{
    if (enabled == m_blendEnabled)
        return;
    stateChanged();
    m_blendEnabled = enabled;
    setCapability(GL_BLEND, enabled);
}

void RenderContext::setBlendColour(const Colour4f& colour)
{
    if (colour == m_state.blendColour)
        return;
    stateChanged();
    m_state.blendColour = colour;
    glBlendColor(colour.r, colour.g, colour.b, colour.a);
}

void RenderContext::setBlendFactors(BlendFactor srcColour, BlendFactor srcAlpha, BlendFactor dstColour,
                                    BlendFactor dstAlpha)
{
    if (srcColour == m_state.blendSrcColour && srcAlpha == m_state.blendSrcAlpha &&
        dstColour == m_state.blendDstColour && dstAlpha == m_state.blendDstAlpha)
        return;
    stateChanged();
    m_state.blendSrcColour = srcColour;
    m_state.blendSrcAlpha = srcAlpha;
    m_state.blendDstColour = dstColour;
    m_state.blendDstAlpha = dstAlpha;
    glBlendFuncSeparate(glBlendFactorConvert(srcColour), glBlendFactorConvert(dstColour),
                        glBlendFactorConvert(srcAlpha), glBlendFactorConvert(dstAlpha));
}

void RenderContext::setBlendFunctions(BlendFunction colour, BlendFunction alpha)
{
    if (colour == m_state.blendFunctionColour && alpha == m_state.blendFunctionAlpha)
        return;
    stateChanged();
    m_state.blendFunctionColour = colour;
    m_state.blendFunctionAlpha = alpha;
    glBlendEquationSeparate(glBlendFunctionConvert(colour), glBlendFunctionConvert(alpha));
}

void RenderContext::setCullingMode(CullingMode mode)
{
    if (mode == m_state.cullingMode)
        return;
    stateChanged();
    const CullingMode previous = m_state.cullingMode;
    m_state.cullingMode = mode;
    if (mode == CullingMode::CULL_NONE)
    {
        glDisable(GL_CULL_FACE);
        return;
    }

    if (previous == CullingMode::CULL_NONE)
        glEnable(GL_CULL_FACE);
    glCullFace(glCullingModeConvert(mode));
}

void RenderContext::setWindingOrder(WindingOrder order)
{
    if (order == m_state.windingOrder)
        return;
    stateChanged();
    m_state.windingOrder = order;
    glFrontFace(glWindingOrderConvert(order));
}

void RenderContext::setLineWidth(float pixels)
{
    if (pixels == m_state.lineWidth || !detail::allowLineWidth(pixels))
        return;
    stateChanged();
    m_state.lineWidth = pixels;
    glLineWidth(pixels);
}

void RenderContext::setColourMask(bool red, bool green, bool blue, bool alpha)
{
    if (red == m_state.colourMaskRed && green == m_state.colourMaskGreen && blue == m_state.colourMaskBlue &&
        alpha == m_state.colourMaskAlpha)
        return;
    stateChanged();
    m_state.colourMaskRed = red;
    m_state.colourMaskGreen = green;
    m_state.colourMaskBlue = blue;
    m_state.colourMaskAlpha = alpha;
    glColorMask(red, green, blue, alpha);
}

void RenderContext::setDepthWriteEnabled(bool enabled)
{
    if (enabled == m_state.depthWriteEnabled)
        return;
    stateChanged();
    m_state.depthWriteEnabled = enabled;
    glDepthMask(enabled);
}

void RenderContext::setDepthOffset(float factor, float units)
{
    const float previousFactor = m_state.depthOffsetFactor;
    const float previousUnits = m_state.depthOffsetUnits;
    if ((factor == previousFactor && units == previousUnits) ||
        !detail::allowNumbers("Depth offset", factor, units))
        return;
    stateChanged();
    m_state.depthOffsetFactor = factor;
    m_state.depthOffsetUnits = units;
    if (factor == 0.0f && units == 0.0f)
    {
        glDisable(GL_POLYGON_OFFSET_FILL);
        return;
    }

    if (previousFactor == 0.0f && previousUnits == 0.0f)
        glEnable(GL_POLYGON_OFFSET_FILL);
    // The values of the previous change, as documented.
    glPolygonOffset(previousFactor, previousUnits);
}

void RenderContext::setDepthTestEnabled(bool enabled)
{
    if (enabled == m_state.depthTestEnabled)
        return;
    stateChanged();
    m_state.depthTestEnabled = enabled;
    setCapability(GL_DEPTH_TEST, enabled);
}

void RenderContext::setDepthTestFunction(DepthFunction function)
{
    if (function == m_state.depthFunction)
        return;
    stateChanged();
    m_state.depthFunction = function;
    glDepthFunc(glDepthFunctionConvert(function));
}

void RenderContext::setScissorTestEnabled(bool enabled)
{
    if (enabled == m_state.scissorTestEnabled)
        return;
    stateChanged();
    m_state.scissorTestEnabled = enabled;
    setCapability(GL_SCISSOR_TEST, enabled);
}

void RenderContext::setScissorBox(int x, int y, int width, int height)
{
    if (x == m_state.scissorX && y == m_state.scissorY && width == m_state.scissorWidth &&
        height == m_state.scissorHeight)
        return;
    if (!detail::allowSize("Scissor box", width, height))
        return;
    stateChanged();
    m_state.scissorX = x;
    m_state.scissorY = y;
    m_state.scissorWidth = width;
    m_state.scissorHeight = height;
    glScissor(x, y, width, height);
}

void RenderContext::setStencilTestEnabled(bool enabled)
{
    if (enabled == m_state.stencilTestEnabled)
        return;
    stateChanged();
    m_state.stencilTestEnabled = enabled;
    setCapability(GL_STENCIL_TEST, enabled);
}

void RenderContext::setStencilFunction(StencilFace face, StencilFunction function, int reference,
                                       unsigned mask)
{
    const auto i = unsigned(face);
    if (i < STENCIL_FACE_COUNT)
    {
        if (function == m_state.stencilFunction[i] && reference == m_state.stencilReference[i] &&
            mask == m_state.stencilFunctionMask[i])
            return;
        stateChanged();
        m_state.stencilFunction[i] = function;
        m_state.stencilReference[i] = reference;
        m_state.stencilFunctionMask[i] = mask;
    }
    glStencilFuncSeparate(glStencilFaceConvert(face), glStencilFunctionConvert(function), reference, mask);
}

void RenderContext::setStencilOperations(StencilFace face, StencilOperation stencilFail,
                                         StencilOperation depthFail, StencilOperation pass)
{
    const auto i = unsigned(face);
    if (i < STENCIL_FACE_COUNT)
    {
        if (stencilFail == m_state.stencilFailOperation[i] &&
            depthFail == m_state.stencilDepthFailOperation[i] && pass == m_state.stencilPassOperation[i])
            return;
        stateChanged();
        m_state.stencilFailOperation[i] = stencilFail;
        m_state.stencilDepthFailOperation[i] = depthFail;
        m_state.stencilPassOperation[i] = pass;
    }
    glStencilOpSeparate(glStencilFaceConvert(face), glStencilOperationConvert(stencilFail),
                        glStencilOperationConvert(depthFail), glStencilOperationConvert(pass));
}

void RenderContext::setStencilMask(StencilFace face, unsigned mask)
{
    const auto i = unsigned(face);
    if (i < STENCIL_FACE_COUNT)
    {
        if (mask == m_state.stencilWriteMask[i])
            return;
        stateChanged();
        m_state.stencilWriteMask[i] = mask;
    }
    glStencilMaskSeparate(glStencilFaceConvert(face), mask);
}

void RenderContext::setViewport(int x, int y, int width, int height)
{
    if (x == m_viewport[0] && y == m_viewport[1] && width == m_viewport[2] && height == m_viewport[3])
        return;
    if (!detail::allowSize("Viewport", width, height))
        return;
    m_viewport[0] = x;
    m_viewport[1] = y;
    m_viewport[2] = width;
    m_viewport[3] = height;
    glViewport(x, y, width, height);
}

void RenderContext::setDepthRange(float zNear, float zFar)
{
    if ((zNear == m_depthRange[0] && zFar == m_depthRange[1]) ||
        !detail::allowNumbers("Depth range", zNear, zFar))
        return;
    m_depthRange[0] = zNear;
    m_depthRange[1] = zFar;
    glDepthRangef(zNear, zFar);
}

void RenderContext::setClearColour(const Colour4f& colour)
{
    if (colour == m_clearColour)
        return;
    m_clearColour = colour;
    glClearColor(colour.r, colour.g, colour.b, colour.a);
}

void RenderContext::setClearDepth(float depth)
{
    if (depth == m_clearDepth || !detail::allowNumbers("Clear depth", depth))
        return;
    m_clearDepth = depth;
    glClearDepthf(depth);
}

void RenderContext::setClearStencil(int stencil)
{
    if (stencil == m_clearStencil)
        return;
    m_clearStencil = stencil;
    glClearStencil(stencil);
}

void RenderContext::clear()
{
    glClear(GL_COLOR_BUFFER_BIT | GL_DEPTH_BUFFER_BIT | GL_STENCIL_BUFFER_BIT);
}

void RenderContext::applyChanged(const RenderState& state, uint64_t stateRevision, uint32_t flags)
{
    const bool isUnchanged = m_appliedRevision != 0 && flags == m_appliedFlags && state == m_appliedState;
    if (isUnchanged)
        return;
    setBlendEnabled((flags & APPLY_BLEND) != 0);
    setBlendColour(state.blendColour);
    setBlendFactors(state.blendSrcColour, state.blendSrcAlpha, state.blendDstColour, state.blendDstAlpha);
    setBlendFunctions(state.blendFunctionColour, state.blendFunctionAlpha);
    setCullingMode(state.cullingMode);
    setWindingOrder((flags & APPLY_TURNED) != 0 ? turned(state.windingOrder) : state.windingOrder);
    setLineWidth(state.lineWidth);
    setColourMask(state.colourMaskRed, state.colourMaskGreen, state.colourMaskBlue, state.colourMaskAlpha);
    setDepthWriteEnabled(state.depthWriteEnabled);
    setDepthOffset(state.depthOffsetFactor, state.depthOffsetUnits);
    setDepthTestEnabled(state.depthTestEnabled);
    setDepthTestFunction(state.depthFunction);
    setScissorTestEnabled(state.scissorTestEnabled);
    setScissorBox(state.scissorX, state.scissorY, state.scissorWidth, state.scissorHeight);
    setStencilTestEnabled(state.stencilTestEnabled);
    for (int i = 0; i < STENCIL_FACE_COUNT; ++i)
    {
        const auto face = StencilFace(i);
        // The write mask twice, as documented.
        setStencilFunction(face, state.stencilFunction[i], state.stencilReference[i],
                           state.stencilWriteMask[i]);
        setStencilOperations(face, state.stencilFailOperation[i], state.stencilDepthFailOperation[i],
                             state.stencilPassOperation[i]);
        setStencilMask(face, state.stencilWriteMask[i]);
    }
    m_appliedState = state;
    m_appliedRevision = stateRevision;
    m_appliedFlags = flags;
}

unsigned RenderContext::glBlendFactorConvert(BlendFactor factor)
{
    return toGL(GL_BLEND_FACTORS, factor, "blend factor", __func__);
}

unsigned RenderContext::glBlendFunctionConvert(BlendFunction function)
{
    return toGL(GL_BLEND_FUNCTIONS, function, "blend function", __func__);
}

unsigned RenderContext::glCullingModeConvert(CullingMode mode)
{
    return toGL(GL_CULLED_FACES, mode, "culling mode", __func__);
}

unsigned RenderContext::glWindingOrderConvert(WindingOrder order)
{
    return toGL(GL_WINDING_ORDERS, order, "winding order", __func__);
}

unsigned RenderContext::glDepthFunctionConvert(DepthFunction function)
{
    return toGL(GL_COMPARISONS, function, "depth function", __func__);
}

unsigned RenderContext::glStencilFaceConvert(StencilFace face)
{
    return toGL(GL_STENCIL_FACES, face, "stencil face", __func__);
}

unsigned RenderContext::glStencilFunctionConvert(StencilFunction function)
{
    return toGL(GL_COMPARISONS, function, "stencil function", __func__);
}

unsigned RenderContext::glStencilOperationConvert(StencilOperation operation)
{
    return toGL(GL_STENCIL_OPERATIONS, operation, "stencil operation", __func__);
}

void setStencilFunction(RenderContext& context, StencilFunction function, int reference, unsigned mask)
{
    context.setStencilFunction(StencilFace::BACK, function, reference, mask);
    context.setStencilFunction(StencilFace::FRONT, function, reference, mask);
}

void setStencilOperations(RenderContext& context, StencilOperation stencilFail, StencilOperation depthFail,
                          StencilOperation pass)
{
    context.setStencilOperations(StencilFace::BACK, stencilFail, depthFail, pass);
    context.setStencilOperations(StencilFace::FRONT, stencilFail, depthFail, pass);
}

void setStencilMask(RenderContext& context, unsigned mask)
{
    context.setStencilMask(StencilFace::BACK, mask);
    context.setStencilMask(StencilFace::FRONT, mask);
}

} // namespace orv
