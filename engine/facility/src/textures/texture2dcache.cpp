#include "orv/texture2dcache.h"

#include "gl/countedgl.h"
#include "gltexture.h"

#include "orv/detail/bindingepoch.h"
#include "orv/extensions.h"
#include "orv/log.h"
#include "orv/rendercontext.h"
#include "orv/renderdevice.h"

#include <GLES2/gl2ext.h>

#include <iterator>

namespace orv
{

namespace
{

/// The type as which the driver reads a surface; UNSIGNED_BYTE for unknown types.
Texture::Type getSurfaceType()
{
    GLint glType = 0;
    glGetIntegerv(GL_IMPLEMENTATION_COLOR_READ_TYPE, &glType);
    for (std::size_t i = 0; i < std::size(detail::GL_TEXTURE_TYPES); ++i)
    {
        if (detail::GL_TEXTURE_TYPES[i] == unsigned(glType))
            return Texture::Type(i);
    }
    return Texture::Type::UNSIGNED_BYTE;
}

void setGlParameters(GLenum target, GLint minFilter, GLint magFilter, GLint wrap)
{
    glTexParameteri(target, GL_TEXTURE_MIN_FILTER, minFilter);
    glTexParameteri(target, GL_TEXTURE_MAG_FILTER, magFilter);
    glTexParameteri(target, GL_TEXTURE_WRAP_S, wrap);
    glTexParameteri(target, GL_TEXTURE_WRAP_T, wrap);
}

} // namespace

Texture2DCache::Texture2DCache() = default;

Texture2DCache::~Texture2DCache() = default;

SharedPtr<detail::TextureResource> Texture2DCache::createResource()
{
    auto resource = makeShared<detail::TextureResource>();
    getResourceCache()->add(resource);
    if (resource && !resource->allocate())
        resource.reset();
    return resource;
}

SharedPtr<Texture2D> Texture2DCache::create(unsigned width, unsigned height, Texture::Format format,
                                            Texture::Type type, const void* pixels, const char* name)
{
    const unsigned glFormat = detail::getGlTextureFormat(format);
    const unsigned glType = detail::getGlTextureType(type);
    if (width == 0 || height == 0 || glFormat == GL_INVALID_ENUM || glType == GL_INVALID_ENUM)
        return {};
    const SharedPtr<detail::TextureResource> resource = createResource();
    if (!resource)
        return {};

    const bool isDepth = format == Texture::Format::DEPTH;
    const bool isFullFeatured = !isDepth && detail::isPowerOfTwo(width, height);
    RenderDevice::getError(false);
    glPixelStorei(GL_UNPACK_ALIGNMENT, 1);
    glBindTexture(GL_TEXTURE_2D, resource->getId());
    detail::bindingsChanged();
    glTexImage2D(GL_TEXTURE_2D, 0, GLint(glFormat), GLsizei(width), GLsizei(height), 0, glFormat, glType,
                 pixels);
    if (isFullFeatured)
        glGenerateMipmap(GL_TEXTURE_2D);
    setGlParameters(GL_TEXTURE_2D, isFullFeatured ? GL_LINEAR_MIPMAP_NEAREST : GL_LINEAR, GL_LINEAR,
                    isFullFeatured ? GL_REPEAT : GL_CLAMP_TO_EDGE);
    // No memory, or no depth textures.
    if (detail::reportGLError(detail::sourcePathText<__FILE__>, __func__, __LINE__))
    {
        resource->deallocate();
        return {};
    }

    const auto bytesPerPixel = float(Texture::getBytesPerPixel(format, type));
    auto texture =
        makeShared<Texture2D>(width, height, bytesPerPixel, isFullFeatured, resource, false, isDepth);
    if (texture)
        add(texture, name);
    return texture;
}

SharedPtr<Texture2D> Texture2DCache::create(unsigned width, unsigned height, float bytesPerPixel,
                                            bool hasMipmaps, unsigned glName, const char* name)
{
    const auto resource = makeShared<detail::TextureResource>(glName);
    if (!resource)
    {
        glDeleteTextures(1, &glName);
        detail::bindingsChanged();
        return {};
    }
    getResourceCache()->add(resource);
    auto texture = makeShared<Texture2D>(width, height, bytesPerPixel, hasMipmaps, resource, false);
    if (texture)
        add(texture, name);
    return texture;
}

SharedPtr<Texture2D> Texture2DCache::createFromBackbuffer(const RenderContext& context,
                                                          Texture::Format format, const char* name)
{
    if (format == Texture::Format::DEPTH)
    {
        ORV_LOG_ERROR("Creating depth texture from backbuffer is not permitted.");
        return {};
    }
    const int width = context.getViewportWidth();
    const int height = context.getViewportHeight();
    const unsigned glFormat = detail::getGlTextureFormat(format);
    if (width <= 0 || height <= 0 || glFormat == GL_INVALID_ENUM)
    {
        ORV_LOG_ERROR("No texture from backbuffer: viewport %d x %d, format %d.", width, height, int(format));
        return {};
    }
    const SharedPtr<detail::TextureResource> resource = createResource();
    if (!resource)
        return {};

    // An older error must not be taken for the copy's; it stays remembered.
    RenderDevice::getError(false);
    glBindTexture(GL_TEXTURE_2D, resource->getId());
    detail::bindingsChanged();
    glCopyTexImage2D(GL_TEXTURE_2D, 0, glFormat, 0, 0, width, height, 0);
    const RenderDevice::ErrorCode error = RenderDevice::getError(false);
    if (error != RenderDevice::ErrorCode::NO_ERROR)
    {
        ORV_LOG_ERROR("No texture from backbuffer, format %d: OpenGL error %d: %s", int(format), int(error),
                      RenderDevice::getErrorString(error));
        resource->deallocate();
        return {};
    }

    const auto bytesPerPixel = float(Texture::getBytesPerPixel(format, getSurfaceType()));
    auto texture =
        makeShared<Texture2D>(unsigned(width), unsigned(height), bytesPerPixel, false, resource, false);
    if (!texture)
        return {};
    add(texture, name);
    texture->setMagFilter(TextureParameters::FilterMode::LINEAR);
    texture->setMinFilter(TextureParameters::FilterMode::NEAREST);
    texture->setHorizontalWrap(TextureParameters::WrapMode::CLAMP);
    texture->setVerticalWrap(TextureParameters::WrapMode::CLAMP);
    return texture;
}

SharedPtr<Texture2D> Texture2DCache::createForExternalSource()
{
    if (!GL_OES_EGL_image_external_supported())
    {
        ORV_LOG_ERROR("Extension \"GL_OES_EGL_image_external\" not supported.");
        return {};
    }
    const SharedPtr<detail::TextureResource> resource = createResource();
    if (!resource)
        return {};

    glBindTexture(GL_TEXTURE_EXTERNAL_OES, resource->getId());
    detail::bindingsChanged();
    setGlParameters(GL_TEXTURE_EXTERNAL_OES, GL_NEAREST, GL_LINEAR, GL_CLAMP_TO_EDGE);
    return makeShared<Texture2D>(0u, 0u, 0.0f, false, resource, true);
}

unsigned getTotalAssetSizeInBytes(const Texture2DCache& cache)
{
    unsigned total = 0;
    cache.forEachAsset(
        [&total](const SharedPtr<Texture2D>& texture)
        {
            ORV_ASSERT(texture);
            total += texture ? texture->getSizeInBytes() : 0;
        });
    return total;
}

} // namespace orv
