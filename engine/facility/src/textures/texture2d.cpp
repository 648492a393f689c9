#include "orv/texture2d.h"

#include "gl/countedgl.h"
#include "gltexture.h"

#include "orv/detail/bindingepoch.h"
#include "orv/log.h"
#include "orv/renderdevice.h"

#include <GLES2/gl2ext.h>

#include <algorithm>
#include <climits>
#include <cstddef>

namespace orv
{

namespace
{

/// The enum value of a GL one; value 0 for a GL value that is not in the table.
template <class Enum, std::size_t N>
Enum findEnum(const int (&table)[N], int glValue)
{
    for (std::size_t i = 0; i < N; ++i)
    {
        if (table[i] == glValue)
            return Enum(i);
    }
    return Enum(0);
}

unsigned getSize(unsigned width, unsigned height, float bytesPerPixel)
{
    const double bytes = double(bytesPerPixel) * width * height;
    return bytes > 0.0 ? unsigned(std::min(bytes, double(UINT_MAX))) : 0;
}

} // namespace

Texture2D::Texture2D(unsigned width, unsigned height, float bytesPerPixel, bool hasMipmaps,
                     const SharedPtr<detail::TextureResource>& resource, bool external, bool depth)
    : m_resource(resource)
    , m_width(width)
    , m_height(height)
    , m_hasMipmaps(hasMipmaps)
    , m_sizeInBytes(getSize(width, height, bytesPerPixel))
    , m_external(external)
    , m_depth(depth)
    , m_compressed(bytesPerPixel > 0.0f && bytesPerPixel < 1.0f)
{
}

Texture2D::~Texture2D() = default;

void Texture2D::enable()
{
    glBindTexture(getTarget(), getId());
    detail::bindingsChanged();
}

void Texture2D::discard()
{
    if (m_resource)
        m_resource->deallocate();
}

bool Texture2D::canHaveMipmaps() const
{
    return !m_external && !m_depth && (!m_compressed || m_hasMipmaps) &&
           detail::isPowerOfTwo(m_width, m_height);
}

void Texture2D::setMinFilter(FilterMode mode)
{
    if (getId() == 0)
        return;
    enable();
    if (detail::isMipmapFilter(mode))
    {
        if (!canHaveMipmaps())
        {
            ORV_LOG_ERROR("Mipmap filter %d refused: a texture that is compressed, external, depth or of a "
                          "size that is not a power of two (%u x %u) has no mipmaps.",
                          int(mode), m_width, m_height);
            return;
        }
        if (!m_hasMipmaps)
        {
            RenderDevice::getError(false);
            glGenerateMipmap(GL_TEXTURE_2D);
            if (detail::reportGLError(detail::sourcePathText<__FILE__>, __func__, __LINE__))
                return; // no memory: without them GL would draw black
            m_hasMipmaps = true;
        }
    }
    glTexParameteri(getTarget(), GL_TEXTURE_MIN_FILTER, detail::getGlFilterMode(mode));
}

void Texture2D::setMagFilter(FilterMode mode)
{
    if (getId() == 0)
        return;
    enable();
    if (mode != FilterMode::NEAREST && mode != FilterMode::LINEAR)
    {
        ORV_LOG_ERROR("Only LINEAR and NEAREST supported for Mag Filter.");
        return;
    }
    glTexParameteri(getTarget(), GL_TEXTURE_MAG_FILTER, detail::getGlFilterMode(mode));
}

void Texture2D::setHorizontalWrap(WrapMode mode)
{
    setWrap(GL_TEXTURE_WRAP_S, mode);
}

void Texture2D::setVerticalWrap(WrapMode mode)
{
    setWrap(GL_TEXTURE_WRAP_T, mode);
}

void Texture2D::setWrap(unsigned parameter, WrapMode mode)
{
    if (getId() == 0)
        return;
    enable();
    const bool repeats = mode == WrapMode::REPEAT || mode == WrapMode::MIRRORED_REPEAT;
    if (repeats && (m_external || !detail::isPowerOfTwo(m_width, m_height)))
    {
        ORV_LOG_ERROR(
            "Repeating wrap %d refused: a texture that is external or of a size that is not a power "
            "of two (%u x %u) can only clamp.",
            int(mode), m_width, m_height);
        return;
    }
    glTexParameteri(getTarget(), parameter, detail::getGlWrapMode(mode));
}

void Texture2D::setParameters(const TextureParameters& parameters)
{
    setMinFilter(parameters.minFilter);
    setMagFilter(parameters.magFilter);
    setHorizontalWrap(parameters.horizontalWrap);
    setVerticalWrap(parameters.verticalWrap);
}

Texture2D::FilterMode Texture2D::getFilter(unsigned parameter)
{
    return findEnum<FilterMode>(detail::GL_FILTER_MODES, readParameter(parameter));
}

Texture2D::WrapMode Texture2D::getWrap(unsigned parameter)
{
    return findEnum<WrapMode>(detail::GL_WRAP_MODES, readParameter(parameter));
}

int Texture2D::readParameter(unsigned parameter)
{
    if (getId() == 0)
        return 0;
    enable();
    GLint value = 0;
    glGetTexParameteriv(getTarget(), parameter, &value);
    return value;
}

Texture2D::FilterMode Texture2D::getMinFilter()
{
    return getFilter(GL_TEXTURE_MIN_FILTER);
}

Texture2D::FilterMode Texture2D::getMagFilter()
{
    return getFilter(GL_TEXTURE_MAG_FILTER);
}

Texture2D::WrapMode Texture2D::getHorizontalWrap()
{
    return getWrap(GL_TEXTURE_WRAP_S);
}

Texture2D::WrapMode Texture2D::getVerticalWrap()
{
    return getWrap(GL_TEXTURE_WRAP_T);
}

} // namespace orv
