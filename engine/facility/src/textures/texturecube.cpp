#include "orv/texturecube.h"

#include "gltexture.h"

#include "orv/detail/bindingepoch.h"
#include "orv/log.h"
#include "orv/renderdevice.h"

namespace orv
{

using FilterMode = TextureParameters::FilterMode;
using WrapMode = TextureParameters::WrapMode;

TextureCube::TextureCube(unsigned width, unsigned height, Texture::Format format, Texture::Type type,
                         const SharedPtr<detail::TextureResource>& resource)
    : m_resource(resource)
    , m_width(width)
    , m_height(height)
    , m_format(format)
    , m_type(type)
    , m_parameters(FilterMode::LINEAR_MIPMAP_NEAREST, FilterMode::LINEAR, WrapMode::CLAMP, WrapMode::CLAMP)
{
}

TextureCube::~TextureCube() = default;

void TextureCube::enable()
{
    glBindTexture(GL_TEXTURE_CUBE_MAP, getId());
    detail::bindingsChanged();
}

void TextureCube::setFace(Face face, const void* pixels)
{
    const unsigned format = detail::getGlTextureFormat(m_format);
    const unsigned type = detail::getGlTextureType(m_type);
    const auto faceIndex = unsigned(face);
    if (getId() == 0 || format == GL_INVALID_ENUM || type == GL_INVALID_ENUM || faceIndex >= FACE_COUNT)
        return;
    if (!detail::requireSquareFaces(m_width, m_height))
        return;

    enable();
    if (m_facesSet == 0)
        RenderDevice::getError(false); // an older error must not be taken for one of these faces
    glPixelStorei(GL_UNPACK_ALIGNMENT, 1);
    glTexImage2D(detail::GL_CUBE_FACES[faceIndex], 0, GLint(format), GLsizei(m_width), GLsizei(m_height), 0,
                 format, type, pixels);
    ++m_facesSet;
    if (m_facesSet == FACE_COUNT)
    {
        sendParameters();
        if (detail::reportGLError(detail::sourcePathText<__FILE__>, __func__, __LINE__))
            m_facesSet = 0; // no memory for one of the faces: all six have to be set again
    }
}

void TextureCube::setParameters(const TextureParameters& parameters)
{
    if (parameters.magFilter != FilterMode::NEAREST && parameters.magFilter != FilterMode::LINEAR)
    {
        ORV_LOG_ERROR("Only LINEAR and NEAREST supported for Mag Filter.");
        return;
    }
    if (detail::getGlFilterMode(parameters.minFilter) < 0 ||
        detail::getGlWrapMode(parameters.horizontalWrap) < 0 ||
        detail::getGlWrapMode(parameters.verticalWrap) < 0)
    {
        ORV_LOG_ERROR("Filter %d or wrap %d, %d is no mode; the old ones are kept.",
                      int(parameters.minFilter), int(parameters.horizontalWrap),
                      int(parameters.verticalWrap));
        return;
    }

    m_parameters = parameters;
    if (m_facesSet < FACE_COUNT || getId() == 0)
        return;
    enable();
    sendParameters();
}

void TextureCube::sendParameters()
{
    TextureParameters sent = m_parameters;
    if (m_format == Texture::Format::DEPTH || !detail::isPowerOfTwo(m_width, m_height))
    {
        sent.horizontalWrap = WrapMode::CLAMP;
        sent.verticalWrap = WrapMode::CLAMP;
        if (sent.minFilter != FilterMode::NEAREST)
            sent.minFilter = FilterMode::LINEAR;
    }
    if (detail::isMipmapFilter(sent.minFilter))
        glGenerateMipmap(GL_TEXTURE_CUBE_MAP);
    glTexParameteri(GL_TEXTURE_CUBE_MAP, GL_TEXTURE_MIN_FILTER, detail::getGlFilterMode(sent.minFilter));
    glTexParameteri(GL_TEXTURE_CUBE_MAP, GL_TEXTURE_MAG_FILTER, detail::getGlFilterMode(sent.magFilter));
    glTexParameteri(GL_TEXTURE_CUBE_MAP, GL_TEXTURE_WRAP_S, detail::getGlWrapMode(sent.horizontalWrap));
    glTexParameteri(GL_TEXTURE_CUBE_MAP, GL_TEXTURE_WRAP_T, detail::getGlWrapMode(sent.verticalWrap));
}

bool detail::requireSquareFaces(unsigned width, unsigned height)
{
    if (width == height)
        return true;
    ORV_LOG_ERROR(
        "Error: Cube map texture is not square.  Width and height parameter of faces of the cube map "
        "texture are not equal. If used glTexImage2D after this then, it will result into GL error "
        ": 'Invalid Value'");
    return false;
}

} // namespace orv
