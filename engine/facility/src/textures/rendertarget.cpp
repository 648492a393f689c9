#include "orv/rendertarget.h"

#include "gl/countedgl.h"

#include "orv/log.h"
#include "orv/renderdevice.h"

#include <GLES2/gl2ext.h>

namespace orv
{

namespace
{

void attachTexture(GLenum attachment, unsigned name)
{
    glFramebufferTexture2D(GL_FRAMEBUFFER, attachment, GL_TEXTURE_2D, name, 0);
}

/// @return the new renderbuffer, bound but attached nowhere; 0 if GL has none.
unsigned createRenderbuffer(GLenum format, unsigned width, unsigned height)
{
    GLuint name = 0;
    glGenRenderbuffers(1, &name);
    if (name == 0)
        return 0;
    glBindRenderbuffer(GL_RENDERBUFFER, name);
    glRenderbufferStorage(GL_RENDERBUFFER, format, GLsizei(width), GLsizei(height));
    return name;
}

void attachRenderbuffer(GLenum attachment, unsigned name)
{
    glFramebufferRenderbuffer(GL_FRAMEBUFFER, attachment, GL_RENDERBUFFER, name);
}

void logStatus(GLenum status)
{
    switch (status)
    {
    case GL_FRAMEBUFFER_INCOMPLETE_ATTACHMENT:
        ORV_LOG_ERROR("Framebuffer attachment points not complete.");
        break;
    case GL_FRAMEBUFFER_INCOMPLETE_MISSING_ATTACHMENT:
        ORV_LOG_ERROR("No valid attachments in framebuffer.");
        break;
    case GL_FRAMEBUFFER_INCOMPLETE_DIMENSIONS:
        ORV_LOG_ERROR("Framebuffer attachments do not have same width and height.");
        break;
    case GL_FRAMEBUFFER_UNSUPPORTED:
        ORV_LOG_ERROR("Combination of internal formats used by framebuffer attachments is not renderable.");
        break;
    default: ORV_LOG_ERROR("Error: Unknown status code: %d", int(status)); break;
    }
}

bool hasName(const SharedPtr<Texture2D>& texture)
{
    return texture && texture->getId() != 0;
}

} // namespace

RenderTarget::RenderTarget(const SharedPtr<Texture2D>& colour, const SharedPtr<Texture2D>& depth,
                           bool depthBuffer, bool stencilBuffer)
    : m_colour(colour)
    , m_depth(depth)
{
    GLuint name = 0;
    glGenFramebuffers(1, &name);
    if (name == 0)
    {
        ORV_LOG_ERROR("Failed to create framebuffer");
        return;
    }
    m_framebuffer = name;

    const unsigned previous = getBoundFramebuffer();
    GLint previousRenderbuffer = 0;
    glGetIntegerv(GL_RENDERBUFFER_BINDING, &previousRenderbuffer);
    bindFramebuffer(m_framebuffer);
    attach(depthBuffer, stencilBuffer);
    GLenum status = glCheckFramebufferStatus(GL_FRAMEBUFFER);
    if (status == GL_FRAMEBUFFER_UNSUPPORTED && retryPacked())
        status = glCheckFramebufferStatus(GL_FRAMEBUFFER);
    m_complete = status == GL_FRAMEBUFFER_COMPLETE;
    if (!m_complete)
        logStatus(status);
    glBindRenderbuffer(GL_RENDERBUFFER, GLuint(previousRenderbuffer));
    bindFramebuffer(previous);
}

void RenderTarget::attach(bool depthBuffer, bool stencilBuffer)
{
    m_colourHadName = hasName(m_colour);
    m_depthHadName = hasName(m_depth);
    if (m_colourHadName)
    {
        attachTexture(GL_COLOR_ATTACHMENT0, m_colour->getId());
        m_width = m_colour->getWidth();
        m_height = m_colour->getHeight();
    }
    if (m_depthHadName)
    {
        attachTexture(GL_DEPTH_ATTACHMENT, m_depth->getId());
        if (m_width == 0 && m_height == 0)
        {
            m_width = m_depth->getWidth();
            m_height = m_depth->getHeight();
        }
        else if (m_depth->getWidth() != m_width || m_depth->getHeight() != m_height)
        {
            ORV_LOG_ERROR("Colour and depth textures different sizes");
        }
    }
    else if (depthBuffer)
    {
        m_depthBuffer = createRenderbuffer(GL_DEPTH_COMPONENT16, m_width, m_height);
        if (m_depthBuffer == 0)
            ORV_LOG_ERROR("Failed to create depth renderbuffer");
        else
            attachRenderbuffer(GL_DEPTH_ATTACHMENT, m_depthBuffer);
    }
    if (stencilBuffer)
    {
        m_stencilBuffer = createRenderbuffer(GL_STENCIL_INDEX8, m_width, m_height);
        if (m_stencilBuffer == 0)
            ORV_LOG_ERROR("Failed to create stencil renderbuffer");
        else
            attachRenderbuffer(GL_STENCIL_ATTACHMENT, m_stencilBuffer);
    }
}

/// Many drivers refuse separate depth and stencil buffers: replaces them by a packed one.
bool RenderTarget::retryPacked()
{
    if (m_depthBuffer == 0 || m_stencilBuffer == 0 ||
        !RenderDevice::isExtensionSupported("GL_OES_packed_depth_stencil"))
        return false;
    const unsigned packed = createRenderbuffer(GL_DEPTH24_STENCIL8_OES, m_width, m_height);
    if (packed == 0)
        return false;
    attachRenderbuffer(GL_DEPTH_ATTACHMENT, packed);
    attachRenderbuffer(GL_STENCIL_ATTACHMENT, packed);
    deleteRenderbuffers();
    m_depthBuffer = packed;
    m_stencilBuffer = packed;
    return true;
}

void RenderTarget::deleteRenderbuffers()
{
    if (m_stencilBuffer != 0)
        glDeleteRenderbuffers(1, &m_stencilBuffer);
    if (m_depthBuffer != 0 && m_depthBuffer != m_stencilBuffer)
        glDeleteRenderbuffers(1, &m_depthBuffer);
    m_stencilBuffer = 0;
    m_depthBuffer = 0;
}

RenderTarget::~RenderTarget()
{
    if (isContextLost())
        return;
    deleteRenderbuffers();
    if (m_framebuffer != 0)
        glDeleteFramebuffers(1, &m_framebuffer);
}

bool RenderTarget::isContextLost() const
{
    return (m_colour && m_colourHadName && !hasName(m_colour)) ||
           (m_depth && m_depthHadName && !hasName(m_depth));
}

void RenderTarget::enable()
{
    bindFramebuffer(m_framebuffer);
}

void RenderTarget::disable() const
{
    bindFramebuffer(0);
}

void RenderTarget::setColourTexture(const SharedPtr<Texture2D>& texture)
{
    m_colour = texture;
    m_colourHadName = hasName(texture);
    enable();
    if (texture)
        attachTexture(GL_COLOR_ATTACHMENT0, texture->getId());
}

void RenderTarget::setDepthTexture(const SharedPtr<Texture2D>& texture)
{
    m_depth = texture;
    m_depthHadName = hasName(texture);
    enable();
    if (texture)
        attachTexture(GL_DEPTH_ATTACHMENT, texture->getId());
    // A packed buffer is kept as the stencil buffer.
    if (m_depthBuffer != 0 && m_depthBuffer != m_stencilBuffer)
        glDeleteRenderbuffers(1, &m_depthBuffer);
    m_depthBuffer = 0;
}

unsigned RenderTarget::getBoundFramebuffer()
{
    GLint name = 0;
    glGetIntegerv(GL_FRAMEBUFFER_BINDING, &name);
    return unsigned(name);
}

void RenderTarget::bindFramebuffer(unsigned name)
{
    glBindFramebuffer(GL_FRAMEBUFFER, name);
}

} // namespace orv
