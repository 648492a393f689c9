#include "orv/renderdevice.h"

#include "countedgl.h"

#include "orv/log.h"

#include <EGL/egl.h>

#include <cstring>

namespace orv
{

namespace
{

RenderDevice::ErrorCode g_rememberedError = RenderDevice::ErrorCode::NO_ERROR;

const char* getText(GLenum name)
{
    const GLubyte* text = glGetString(name);
    return text ? reinterpret_cast<const char*>(text) : "";
}

int getInteger(GLenum name)
{
    GLint value = 0;
    glGetIntegerv(name, &value);
    return value;
}

RenderDevice::ErrorCode toErrorCode(GLenum error)
{
    switch (error)
    {
    case GL_NO_ERROR: return RenderDevice::ErrorCode::NO_ERROR;
    case GL_INVALID_ENUM: return RenderDevice::ErrorCode::INVALID_ENUM;
    case GL_INVALID_VALUE: return RenderDevice::ErrorCode::INVALID_VALUE;
    case GL_INVALID_OPERATION: return RenderDevice::ErrorCode::INVALID_OPERATION;
    case GL_INVALID_FRAMEBUFFER_OPERATION: return RenderDevice::ErrorCode::INVALID_FRAMEBUFFER_OPERATION;
    case GL_OUT_OF_MEMORY: return RenderDevice::ErrorCode::OUT_OF_MEMORY;
    default: return RenderDevice::ErrorCode::UNDEFINED;
    }
}

} // namespace

const char* RenderDevice::getVendor()
{
    return getText(GL_VENDOR);
}

const char* RenderDevice::getVersion()
{
    return getText(GL_VERSION);
}

const char* RenderDevice::getExtensions()
{
    return getText(GL_EXTENSIONS);
}

const char* RenderDevice::getShaderVersion()
{
    return getText(GL_SHADING_LANGUAGE_VERSION);
}

int RenderDevice::getMaxVertexUniformVectors()
{
    return getInteger(GL_MAX_VERTEX_UNIFORM_VECTORS);
}

int RenderDevice::getMaxFragmentUniformVectors()
{
    return getInteger(GL_MAX_FRAGMENT_UNIFORM_VECTORS);
}

int RenderDevice::getMaxVertexAttributeVectors()
{
    return getInteger(GL_MAX_VERTEX_ATTRIBS);
}

int RenderDevice::getMaxVaryingVectors()
{
    return getInteger(GL_MAX_VARYING_VECTORS);
}

bool RenderDevice::getSurfaceSize(int& width, int& height)
{
    EGLDisplay display = eglGetCurrentDisplay();
    EGLSurface surface = eglGetCurrentSurface(EGL_DRAW);
    EGLint size[2] = {0, 0};
    if (display == EGL_NO_DISPLAY || surface == EGL_NO_SURFACE ||
        !eglQuerySurface(display, surface, EGL_WIDTH, &size[0]) ||
        !eglQuerySurface(display, surface, EGL_HEIGHT, &size[1]) || size[0] <= 0 || size[1] <= 0)
        return false;
    width = size[0];
    height = size[1];
    return true;
}

void RenderDevice::getPixels(int x, int y, unsigned width, unsigned height, unsigned char* pixels)
{
    const int alignment = getInteger(GL_PACK_ALIGNMENT);
    const bool wouldPad = alignment > 4; // would write beyond the caller's memory; only applications set it
    if (wouldPad)
        glPixelStorei(GL_PACK_ALIGNMENT, 4);
    glReadPixels(x, y, GLsizei(width), GLsizei(height), GL_RGBA, GL_UNSIGNED_BYTE, pixels);
    if (wouldPad)
        glPixelStorei(GL_PACK_ALIGNMENT, alignment);
}

RenderDevice::ErrorCode RenderDevice::getError(bool clear)
{
    const ErrorCode fresh = toErrorCode(glGetError());
    if (!clear)
    {
        if (fresh != ErrorCode::NO_ERROR)
            g_rememberedError = fresh;
        return fresh;
    }

    const ErrorCode error = fresh != ErrorCode::NO_ERROR ? fresh : g_rememberedError;
    g_rememberedError = ErrorCode::NO_ERROR;
    return error;
}

const char* RenderDevice::getErrorString(ErrorCode code)
{
    switch (code)
    {
    case ErrorCode::NO_ERROR: return "No error";
    case ErrorCode::INVALID_ENUM: return "Invalid enum";
    case ErrorCode::INVALID_VALUE: return "Invalid value";
    case ErrorCode::INVALID_OPERATION: return "Invalid operation";
    case ErrorCode::INVALID_FRAMEBUFFER_OPERATION: return "Invalid framebuffer operation";
    case ErrorCode::OUT_OF_MEMORY: return "Out of memory";
    default: return "Undefined error";
    }
}

bool RenderDevice::isExtensionSupported(const char* name)
{
    if (!name || !*name)
        return false;
    const char* extensions = getExtensions();
    const std::size_t length = std::strlen(name);
    for (const char* at = std::strstr(extensions, name); at; at = std::strstr(at + 1, name))
    {
        const bool startsWord = at == extensions || at[-1] == ' ';
        const bool endsWord = at[length] == '\0' || at[length] == ' ';
        if (startsWord && endsWord)
            return true;
    }
    return false;
}

void checkGLError(const char* file, const char* function, int line)
{
    detail::reportGLError(file, function, line);
}

bool detail::reportGLError(const char* file, const char* function, int line)
{
    const RenderDevice::ErrorCode error = RenderDevice::getError(false);
    if (error == RenderDevice::ErrorCode::NO_ERROR)
        return false;
    logError(file, function, line, "OpenGL error %d: %s", int(error), RenderDevice::getErrorString(error));
    return true;
}

} // namespace orv
