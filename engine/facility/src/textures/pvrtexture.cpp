#include "pvrtexture.h"

#include "gl/countedgl.h"

#include "orv/detail/bindingepoch.h"
#include "orv/detail/loadscope.h"
#include "orv/renderdevice.h"
#include "orv/texture.h"
#include "pvr/pvrpixels.h"

#include <GLES2/gl2ext.h>

#include <cstdint>
#include <memory>
#include <new>

namespace orv::detail
{

namespace
{

/// GL's parameters for the pixels of a format.
struct GlPixels
{
    GLenum format;
    GLenum type;
};

/// Of the formats that pvr::unpack() makes.
GlPixels getGlPixels(pvr::Format unpacked)
{
    switch (unpacked)
    {
    case pvr::Format::RGB_888: return {GL_RGB, GL_UNSIGNED_BYTE};
    case pvr::Format::RGB_565: return {GL_RGB, GL_UNSIGNED_SHORT_5_6_5};
    case pvr::Format::RGBA_4444: return {GL_RGBA, GL_UNSIGNED_SHORT_4_4_4_4};
    case pvr::Format::RGBA_5551: return {GL_RGBA, GL_UNSIGNED_SHORT_5_5_5_1};
    case pvr::Format::LA_88: return {GL_LUMINANCE_ALPHA, GL_UNSIGNED_BYTE};
    case pvr::Format::L_8: return {GL_LUMINANCE, GL_UNSIGNED_BYTE};
    case pvr::Format::A_8: return {GL_ALPHA, GL_UNSIGNED_BYTE};
    default: return {GL_RGBA, GL_UNSIGNED_BYTE};
    }
}

/// The format in which GL takes the file's blocks unchanged; GL_NONE if it cannot. Queried for each texture, since it
/// depends on the current context.
GLenum getGlCompressedFormat(const pvr::PvrFile& file)
{
    const pvr::FormatInfo& info = pvr::getInfo(file.format);
    if (!info.isCompressed() || file.bottomRowFirst)
        return GL_NONE;
    if (info.isPvrtc() && file.width() != file.height()) // only some drivers take others
        return GL_NONE;
    if (!RenderDevice::isExtensionSupported(info.isPvrtc() ? "GL_IMG_texture_compression_pvrtc"
                                                           : "GL_OES_compressed_ETC1_RGB8_texture"))
        return GL_NONE;
    switch (file.format)
    {
    case pvr::Format::ETC1: return GL_ETC1_RGB8_OES;
    case pvr::Format::PVRTC_2_RGB: return GL_COMPRESSED_RGB_PVRTC_2BPPV1_IMG;
    case pvr::Format::PVRTC_2_RGBA: return GL_COMPRESSED_RGBA_PVRTC_2BPPV1_IMG;
    case pvr::Format::PVRTC_4_RGB: return GL_COMPRESSED_RGB_PVRTC_4BPPV1_IMG;
    case pvr::Format::PVRTC_4_RGBA: return GL_COMPRESSED_RGBA_PVRTC_4BPPV1_IMG;
    default: return GL_NONE;
    }
}

void uploadCompressed(const pvr::PvrFile& file, const uint8_t* data, size_t levelCount, GLenum format)
{
    for (size_t i = 0; i < levelCount; ++i)
    {
        const pvr::Level& level = file.levels[i];
        glCompressedTexImage2D(GL_TEXTURE_2D, GLint(i), format, GLsizei(level.width), GLsizei(level.height),
                               0, GLsizei(level.size), data + level.offset);
    }
}

bool uploadUnpacked(const pvr::PvrFile& file, const uint8_t* data, size_t levelCount, std::string& error)
{
    const uint64_t bytes = pvr::getUnpackedSize(file, file.levels.front());
    std::unique_ptr<uint8_t[]> pixels;
    if (bytes <= PTRDIFF_MAX)
        pixels.reset(new (std::nothrow) uint8_t[size_t(bytes)]);
    if (!pixels)
    {
        error = "no memory for " + std::to_string(bytes) + " bytes of pixels";
        return false;
    }

    const GlPixels gl = getGlPixels(pvr::getUnpackedFormat(file.format));
    glPixelStorei(GL_UNPACK_ALIGNMENT, 1);
    for (size_t i = 0; i < levelCount; ++i)
    {
        const pvr::Level& level = file.levels[i];
        if (!pvr::unpack(file, data, level, pixels.get()))
        {
            error = "level " + std::to_string(i) + " cannot be decoded";
            return false;
        }
        glTexImage2D(GL_TEXTURE_2D, GLint(i), GLint(gl.format), GLsizei(level.width), GLsizei(level.height),
                     0, gl.format, gl.type, pixels.get());
    }
    return true;
}

void setParameters(bool isPowerOfTwoSized, bool hasMipmaps)
{
    const GLint wrap = isPowerOfTwoSized ? GL_REPEAT : GL_CLAMP_TO_EDGE;
    glTexParameteri(GL_TEXTURE_2D, GL_TEXTURE_MIN_FILTER, hasMipmaps ? GL_LINEAR_MIPMAP_NEAREST : GL_LINEAR);
    glTexParameteri(GL_TEXTURE_2D, GL_TEXTURE_MAG_FILTER, GL_LINEAR);
    glTexParameteri(GL_TEXTURE_2D, GL_TEXTURE_WRAP_S, wrap);
    glTexParameteri(GL_TEXTURE_2D, GL_TEXTURE_WRAP_T, wrap);
}

/// Asks the load for the memory that GL will need.
bool takeLevels(const pvr::PvrFile& file, size_t fileSize, size_t levelCount, bool isUnpacked)
{
    for (size_t i = 0; i < levelCount; ++i)
    {
        const pvr::Level& level = file.levels[i];
        const uint64_t bytes = isUnpacked ? pvr::getUnpackedSize(file, level) : level.size;
        if (i == 0 ? !LoadScope::takePicture(bytes, fileSize) : !LoadScope::takeTexture(bytes))
            return false;
    }
    return true;
}

/// @return false if GL had an error in any of it.
bool fillTexture(const pvr::PvrFile& file, const uint8_t* data, size_t size, PvrTexture& texture,
                 std::string& error)
{
    const bool isPowerOfTwoSized = isPowerOfTwo(file.width(), file.height());
    const size_t levelCount = isPowerOfTwoSized && file.isComplete() ? file.levels.size() : 1;
    const GLenum compressedFormat = getGlCompressedFormat(file);
    const bool isUnpacked = compressedFormat == GL_NONE;
    if (!takeLevels(file, size, levelCount, isUnpacked))
    {
        error = "it is more than this load may have";
        return false;
    }

    RenderDevice::getError(false); // an older error must not be taken for the upload's; it stays remembered
    glBindTexture(GL_TEXTURE_2D, texture.glName);
    bindingsChanged();
    if (compressedFormat != GL_NONE)
        uploadCompressed(file, data, levelCount, compressedFormat);
    else if (!uploadUnpacked(file, data, levelCount, error))
        return false;
    setParameters(isPowerOfTwoSized, levelCount > 1);

    const RenderDevice::ErrorCode code = RenderDevice::getError(false);
    if (code != RenderDevice::ErrorCode::NO_ERROR)
    {
        error = "OpenGL error " + std::to_string(int(code)) + ": " + RenderDevice::getErrorString(code);
        return false;
    }

    texture.width = file.width();
    texture.height = file.height();
    texture.bitsPerPixel =
        pvr::getInfo(isUnpacked ? pvr::getUnpackedFormat(file.format) : file.format).bitsPerPixel;
    texture.mipmapCount = unsigned(levelCount - 1);
    texture.hasUnusedMipmaps = levelCount < file.levels.size();
    return true;
}

} // namespace

bool uploadPvr(const uint8_t* data, size_t size, PvrTexture& texture, std::string& error)
{
    pvr::PvrFile file;
    if (!pvr::parse(data, size, file, error))
        return false;
    GLint largest = 0;
    glGetIntegerv(GL_MAX_TEXTURE_SIZE, &largest);
    if (file.width() > unsigned(largest) || file.height() > unsigned(largest))
    {
        error = "width and height are " + std::to_string(file.width()) + " and " +
                std::to_string(file.height()) + ", more than OpenGL's largest texture, " +
                std::to_string(largest);
        return false;
    }

    PvrTexture made;
    glGenTextures(1, &made.glName);
    if (made.glName == 0)
    {
        error = "Failed to create OpenGL texture";
        return false;
    }
    if (!fillTexture(file, data, size, made, error))
    {
        glDeleteTextures(1, &made.glName);
        bindingsChanged();
        return false;
    }
    texture = made;
    return true;
}

} // namespace orv::detail
