#include "orv/background.h"

#include "orv/rendercontext.h"

namespace orv
{

void Background::setDepth(float depth)
{
    if (detail::allowNumbers("Clear depth", depth))
        m_depth = depth;
}

void Background::setColourMask(bool red, bool green, bool blue, bool alpha)
{
    m_colourMask[0] = red;
    m_colourMask[1] = green;
    m_colourMask[2] = blue;
    m_colourMask[3] = alpha;
}

void Background::enable(RenderContext& context) const
{
    context.setColourMask(m_colourMask[0], m_colourMask[1], m_colourMask[2], m_colourMask[3]);
    context.setDepthWriteEnabled(m_depthMask);
    orv::setStencilMask(context, m_stencilMask);
    context.setClearDepth(m_depth);
    context.setClearStencil(m_stencil);
    context.setClearColour(m_colour);
    if (m_viewportOnly)
        context.setScissorBox(context.getViewportX(), context.getViewportY(), context.getViewportWidth(),
                              context.getViewportHeight());
    context.setScissorTestEnabled(m_viewportOnly);
    context.clear();
    context.setScissorTestEnabled(false);
}

} // namespace orv
