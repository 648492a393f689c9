#pragma once

#include "orv/colour.h"
#include "orv/export.h"

#include <cstdint>

namespace orv
{

class RenderContext;

/// What a view is cleared to, and which buffers are: a mask that is off keeps its buffer.
///
/// The whole surface or target is cleared, beyond the viewport too, unless setViewportOnly() says otherwise.
class ORV_API Background
{
public:
    Background() = default;
    explicit Background(const Colour4f& colour) : m_colour(colour) {} ///< Clears to a colour.

    const Colour4f& getColour() const { return m_colour; } ///< The values that are cleared to.
    void setColour(const Colour4f& colour) { m_colour = colour; }
    float getDepth() const { return m_depth; }
    void setDepth(float depth); ///< NaN is refused (logged)
    int getStencil() const { return m_stencil; }
    void setStencil(int stencil) { m_stencil = stencil; }

    /// Which parts of each buffer are cleared.
    void setColourMask(bool red, bool green, bool blue, bool alpha);
    void setDepthMask(bool enabled) { m_depthMask = enabled; }
    void setStencilMask(uint32_t mask) { m_stencilMask = mask; }

    /// true clears the viewport alone, for a view beside or upon others; false, as at first, the whole surface.
    void setViewportOnly(bool only) { m_viewportOnly = only; }
    bool isViewportOnly() const { return m_viewportOnly; }

    /// Sets masks and clear values, clears, and leaves the scissor test off. The state stays set; for the viewport
    /// alone the scissor box is set to it.
    /// GL thread only.
    void enable(RenderContext& context) const;

private:
    Colour4f m_colour;
    float m_depth = 1.0f;
    int m_stencil = 0;
    bool m_colourMask[4] = {true, true, true, true};
    bool m_depthMask = true;
    bool m_viewportOnly = false;
    uint32_t m_stencilMask = 0xFFFFFFFF;
};

} // namespace orv
