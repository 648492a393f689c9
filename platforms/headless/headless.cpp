#include "headless/headless.h"

#include <EGL/egl.h>
#include <EGL/eglext.h>
#include <GLES2/gl2.h>

#include <cstdio>
#include <cstring>

namespace headless
{

namespace
{

std::string describeEglError(const char* call)
{
    char text[80];
    std::snprintf(text, sizeof text, "%s failed (EGL error 0x%04x)", call, unsigned(eglGetError()));
    return text;
}

bool hasWord(const char* words, const char* word)
{
    const std::string spaced = words ? " " + std::string(words) + " " : "";
    return spaced.find(" " + std::string(word) + " ") != std::string::npos;
}

EGLDisplay getSurfacelessDisplay()
{
    if (!hasWord(eglQueryString(EGL_NO_DISPLAY, EGL_EXTENSIONS), "EGL_MESA_platform_surfaceless"))
        return EGL_NO_DISPLAY;
    const auto getPlatformDisplay =
        reinterpret_cast<PFNEGLGETPLATFORMDISPLAYEXTPROC>(eglGetProcAddress("eglGetPlatformDisplayEXT"));
    if (!getPlatformDisplay)
        return EGL_NO_DISPLAY;
    return getPlatformDisplay(EGL_PLATFORM_SURFACELESS_MESA, EGL_DEFAULT_DISPLAY, nullptr);
}

/// A config with 8 bits per colour channel exactly (drivers list ones with more bits first), or null.
EGLConfig findConfig(EGLDisplay display, const Options& options, int samples)
{
    // clang-format off
    const EGLint wanted[] = {EGL_SURFACE_TYPE, EGL_PBUFFER_BIT,
                             EGL_RENDERABLE_TYPE, EGL_OPENGL_ES2_BIT,
                             EGL_RED_SIZE, 8, EGL_GREEN_SIZE, 8, EGL_BLUE_SIZE, 8, EGL_ALPHA_SIZE, 8,
                             EGL_DEPTH_SIZE, options.depthBits,
                             EGL_STENCIL_SIZE, options.stencilBits,
                             EGL_SAMPLES, samples,
                             EGL_NONE};
    // clang-format on
    EGLint count = 0;
    if (!eglChooseConfig(display, wanted, nullptr, 0, &count) || count <= 0)
        return nullptr;
    std::vector<EGLConfig> configs{size_t(count)};
    eglChooseConfig(display, wanted, configs.data(), count, &count);
    for (EGLConfig config : configs)
    {
        EGLint red = 0;
        EGLint alpha = 0;
        eglGetConfigAttrib(display, config, EGL_RED_SIZE, &red);
        eglGetConfigAttrib(display, config, EGL_ALPHA_SIZE, &alpha);
        if (red == 8 && alpha == 8)
            return config;
    }
    return nullptr;
}

struct Made
{
    EGLDisplay display = EGL_NO_DISPLAY;
    EGLSurface surface = EGL_NO_SURFACE;
    EGLContext context = EGL_NO_CONTEXT;
};

/// Destroys its objects. The display stays initialised: all contexts of the process share it.
void destroy(const Made& made)
{
    if (made.context != EGL_NO_CONTEXT)
        eglDestroyContext(made.display, made.context);
    if (made.surface != EGL_NO_SURFACE)
        eglDestroySurface(made.display, made.surface);
}

bool makeOn(EGLDisplay display, const Options& options, Made& made, std::string& error)
{
    if (!eglInitialize(display, nullptr, nullptr))
    {
        error = describeEglError("eglInitialize");
        return false;
    }
    EGLConfig config = findConfig(display, options, options.samples);
    if (!config)
        config = findConfig(display, options, 0);
    if (!config)
    {
        error = "no RGBA8 config with a pbuffer, depth " + std::to_string(options.depthBits) +
                " and stencil " + std::to_string(options.stencilBits) + " for OpenGL ES 2.0";
        return false;
    }

    const EGLint size[] = {EGL_WIDTH, options.width, EGL_HEIGHT, options.height, EGL_NONE};
    const EGLint version[] = {EGL_CONTEXT_CLIENT_VERSION, 2, EGL_NONE};
    made.display = display;
    made.surface = eglCreatePbufferSurface(display, config, size);
    if (made.surface == EGL_NO_SURFACE)
    {
        error = describeEglError("eglCreatePbufferSurface");
        return false;
    }
    eglBindAPI(EGL_OPENGL_ES_API);
    made.context = eglCreateContext(display, config, EGL_NO_CONTEXT, version);
    if (made.context == EGL_NO_CONTEXT)
        error = describeEglError("eglCreateContext");
    else if (!eglMakeCurrent(display, made.surface, made.surface, made.context))
        error = describeEglError("eglMakeCurrent");
    else
        return true;
    destroy(made);
    made = {};
    return false;
}

/// Tries the platforms in order; error has the reason for each.
bool makeAnywhere(const Options& options, Made& made, std::string& error)
{
    struct Platform
    {
        const char* name;
        EGLDisplay display;
    };
    const Platform platforms[] = {{"surfaceless platform", getSurfacelessDisplay()},
                                  {"default display", eglGetDisplay(EGL_DEFAULT_DISPLAY)}};
    error = "no OpenGL ES 2.0 context without a window: ";
    for (const Platform& platform : platforms)
    {
        std::string reason = "not offered";
        if (platform.display != EGL_NO_DISPLAY)
        {
            reason.clear();
            if (makeOn(platform.display, options, made, reason))
            {
                error.clear();
                return true;
            }
        }
        error +=
            std::string(platform.name) + ": " + reason + (&platform == std::end(platforms) - 1 ? "" : "; ");
    }
    return false;
}

/// Reads a multisampled surface through a texture: a copy resolves the samples, whereas glReadPixels on Mesa's
/// off-screen surfaces picks one of them. Leaves another framebuffer bound.
std::vector<uint8_t> readResolved(int width, int height)
{
    GLint boundTexture = 0;
    GLint alphaBits = 0; // a window's surface may have none; then alpha cannot be copied
    GLuint texture = 0;
    GLuint framebuffer = 0;
    glGetIntegerv(GL_TEXTURE_BINDING_2D, &boundTexture);
    glGenTextures(1, &texture);
    glBindTexture(GL_TEXTURE_2D, texture);
    glGetIntegerv(GL_ALPHA_BITS, &alphaBits);
    glCopyTexImage2D(GL_TEXTURE_2D, 0, alphaBits > 0 ? GL_RGBA : GL_RGB, 0, 0, width, height, 0);
    glGenFramebuffers(1, &framebuffer);
    glBindFramebuffer(GL_FRAMEBUFFER, framebuffer);
    glFramebufferTexture2D(GL_FRAMEBUFFER, GL_COLOR_ATTACHMENT0, GL_TEXTURE_2D, texture, 0);

    std::vector<uint8_t> pixels = readFramebuffer(0, 0, width, height);
    glDeleteFramebuffers(1, &framebuffer);
    glBindTexture(GL_TEXTURE_2D, GLuint(boundTexture));
    glDeleteTextures(1, &texture);
    return pixels;
}

} // namespace

std::unique_ptr<Context> Context::create(const Options& options, std::string& error)
{
    if (options.width <= 0 || options.height <= 0)
    {
        error = "a surface of " + std::to_string(options.width) + " x " + std::to_string(options.height) +
                " pixels cannot be made";
        return nullptr;
    }
    Made made;
    if (!makeAnywhere(options, made, error))
        return nullptr;

    std::unique_ptr<Context> context(new Context);
    context->m_display = made.display;
    context->m_surface = made.surface;
    context->m_context = made.context;
    context->m_width = options.width;
    context->m_height = options.height;
    return context;
}

Context::~Context()
{
    if (isCurrent())
        makeNoneCurrent();
    destroy({m_display, m_surface, m_context});
}

bool Context::makeCurrent()
{
    if (eglMakeCurrent(m_display, m_surface, m_surface, m_context))
        return true;
    std::fprintf(stderr, "headless: %s\n", describeEglError("eglMakeCurrent").c_str());
    return false;
}

bool Context::isCurrent() const
{
    return eglGetCurrentContext() == m_context;
}

void Context::makeNoneCurrent()
{
    EGLDisplay display = eglGetCurrentDisplay();
    if (display != EGL_NO_DISPLAY)
        eglMakeCurrent(display, EGL_NO_SURFACE, EGL_NO_SURFACE, EGL_NO_CONTEXT);
}

std::vector<uint8_t> Context::readPixels() const
{
    return isCurrent() ? readSurface(m_width, m_height) : std::vector<uint8_t>();
}

std::string Context::describe() const
{
    const auto text = [](GLenum name)
    {
        const GLubyte* found = glGetString(name);
        return std::string(found ? reinterpret_cast<const char*>(found) : "unknown");
    };
    return isCurrent() ? text(GL_RENDERER) + ", " + text(GL_VERSION) : "not current";
}

std::vector<uint8_t> readSurface(int width, int height)
{
    GLint bound = 0;
    GLint samples = 0;
    glGetIntegerv(GL_FRAMEBUFFER_BINDING, &bound);
    glBindFramebuffer(GL_FRAMEBUFFER, 0);
    glGetIntegerv(GL_SAMPLES, &samples);
    std::vector<uint8_t> pixels =
        samples > 0 ? readResolved(width, height) : readFramebuffer(0, 0, width, height);
    glBindFramebuffer(GL_FRAMEBUFFER, GLuint(bound));
    return pixels;
}

std::vector<uint8_t> readFramebuffer(int x, int y, int width, int height)
{
    const size_t rowSize = size_t(width) * 4;
    std::vector<uint8_t> bottomUp(rowSize * size_t(height));
    GLint alignment = 4;
    glGetIntegerv(GL_PACK_ALIGNMENT, &alignment);
    glPixelStorei(GL_PACK_ALIGNMENT, 1);
    glReadPixels(x, y, width, height, GL_RGBA, GL_UNSIGNED_BYTE, bottomUp.data());
    glPixelStorei(GL_PACK_ALIGNMENT, alignment);

    std::vector<uint8_t> pixels(bottomUp.size());
    for (size_t row = 0; row < size_t(height); ++row)
        std::memcpy(&pixels[row * rowSize], &bottomUp[(size_t(height) - 1 - row) * rowSize], rowSize);
    return pixels;
}

} // namespace headless
