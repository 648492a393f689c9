#pragma once

#include "orv/export.h"
#include "orv/shared.h"
#include "orv/sharedptr.h"
#include "orv/texture2d.h"

namespace orv
{

/// One framebuffer object: draws go into textures instead of the surface.
///
/// Lives with the renderer that made it. After a context loss it must be made again, like its textures; a
/// target whose texture was released by then (AssetCachePool::release()) deletes nothing when it goes, since
/// its names may belong to something else in the new context. One without textures has no way to tell, so
/// drop it before a new context is made current.
/// GL thread only, the last release included.
class ORV_API RenderTarget : public Shared
{
public:
    using Ptr = SharedPtr<RenderTarget>;

    ORV_CLASS_NAME("RenderTarget")

    /// The framebuffer and the renderbuffer that were bound before are bound again afterwards.
    /// @param colour         may be empty, as may depth; one of them gives the size.
    /// @param depth          replaces the depth buffer even where depthBuffer is true.
    /// @param depthBuffer    16 bits. Together with stencilBuffer, where the driver refuses separate ones, a
    ///                       packed buffer of 24 and 8 bits if GL_OES_packed_depth_stencil is there.
    /// @param stencilBuffer  8 bits.
    RenderTarget(const SharedPtr<Texture2D>& colour, const SharedPtr<Texture2D>& depth, bool depthBuffer,
                 bool stencilBuffer);
    ~RenderTarget() override;

    /// Binds the framebuffer; an incomplete one too, and drawing then fails in GL.
    void enable();
    /// Binds the surface (framebuffer 0). Code that may run inside another target's pass puts that one back
    /// with getBoundFramebuffer() and bindFramebuffer().
    void disable() const;

    /// Attaches another texture and leaves the framebuffer bound. An empty pointer is stored but detaches
    /// nothing.
    void setColourTexture(const SharedPtr<Texture2D>& texture);
    /// The same at the depth attachment; also gives up the depth buffer, if there is one.
    void setDepthTexture(const SharedPtr<Texture2D>& texture);

    /// What it draws into; may be empty.
    const SharedPtr<Texture2D>& getColourTexture() const { return m_colour; }
    const SharedPtr<Texture2D>& getDepthTexture() const { return m_depth; }
    unsigned getId() const { return m_framebuffer; } ///< GL name, 0 if creation failed
    /// As found when the target was made.
    bool isComplete() const { return m_complete; }

    /// The GL name of the framebuffer that draws go to now, 0 for the surface.
    static unsigned getBoundFramebuffer();
    static void bindFramebuffer(unsigned name);

private:
    ORV_LOCAL void attach(bool depthBuffer, bool stencilBuffer);
    ORV_LOCAL bool retryPacked();
    ORV_LOCAL void deleteRenderbuffers();
    ORV_LOCAL bool isContextLost() const;

    unsigned m_framebuffer = 0;
    SharedPtr<Texture2D> m_colour;
    SharedPtr<Texture2D> m_depth;
    unsigned m_depthBuffer = 0;
    unsigned m_stencilBuffer = 0; ///< the same name as m_depthBuffer when they are packed
    bool m_complete = false;
    bool m_colourHadName = false; ///< when it was attached
    bool m_depthHadName = false;
    unsigned m_width = 0; ///< of the attachments, pixels
    unsigned m_height = 0;
};

} // namespace orv
