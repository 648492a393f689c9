// Replaces the examples' context without a window by that of a canvas; pictures go to the page's script instead of
// files.

#include "headless/headless.h"
#include "headless/png.h"

#include <GLES2/gl2.h>

#include <cstring>

#include <emscripten.h>
#include <emscripten/html5.h>

// clang-format off
EM_JS(void, takePicture, (const char* path, int width, int height, const uint8_t* rgba),
      { Module.takePicture(UTF8ToString(path), width, height, HEAPU8.slice(rgba, rgba + width * height * 4)); })
// clang-format on

namespace headless
{

namespace
{

constexpr const char* CANVAS = "#canvas";

void* toHandle(EMSCRIPTEN_WEBGL_CONTEXT_HANDLE context)
{
    return reinterpret_cast<void*>(uintptr_t(context));
}

EMSCRIPTEN_WEBGL_CONTEXT_HANDLE fromHandle(void* context)
{
    return EMSCRIPTEN_WEBGL_CONTEXT_HANDLE(uintptr_t(context));
}

} // namespace

std::unique_ptr<Context> Context::create(const Options& options, std::string& error)
{
    EmscriptenWebGLContextAttributes attributes;
    emscripten_webgl_init_context_attributes(&attributes);
    attributes.premultipliedAlpha = false;
    attributes.preserveDrawingBuffer = true;
    attributes.depth = options.depthBits > 0;
    attributes.stencil = options.stencilBits > 0;
    attributes.antialias = options.samples > 0;
    attributes.majorVersion = 1;
    emscripten_set_canvas_element_size(CANVAS, options.width, options.height);
    const EMSCRIPTEN_WEBGL_CONTEXT_HANDLE made = emscripten_webgl_create_context(CANVAS, &attributes);
    std::unique_ptr<Context> context(new Context);
    context->m_context = toHandle(made);
    context->m_width = options.width;
    context->m_height = options.height;
    if (made > 0 && context->makeCurrent())
        return context;
    error = "no WebGL";
    return nullptr;
}

Context::~Context()
{
    emscripten_webgl_destroy_context(fromHandle(m_context));
}

bool Context::makeCurrent()
{
    return emscripten_webgl_make_context_current(fromHandle(m_context)) == EMSCRIPTEN_RESULT_SUCCESS;
}

bool Context::isCurrent() const
{
    return toHandle(emscripten_webgl_get_current_context()) == m_context;
}

std::vector<uint8_t> Context::readPixels() const
{
    return readSurface(m_width, m_height);
}

std::string Context::describe() const
{
    return reinterpret_cast<const char*>(glGetString(GL_RENDERER));
}

std::vector<uint8_t> readSurface(int width, int height)
{
    GLint bound = 0;
    glGetIntegerv(GL_FRAMEBUFFER_BINDING, &bound);
    glBindFramebuffer(GL_FRAMEBUFFER, 0);
    std::vector<uint8_t> pixels = readFramebuffer(0, 0, width, height);
    glBindFramebuffer(GL_FRAMEBUFFER, GLuint(bound));
    return pixels;
}

std::vector<uint8_t> readFramebuffer(int x, int y, int width, int height)
{
    const size_t rowSize = size_t(width) * 4;
    std::vector<uint8_t> bottomUp(rowSize * size_t(height));
    glReadPixels(x, y, width, height, GL_RGBA, GL_UNSIGNED_BYTE, bottomUp.data());
    std::vector<uint8_t> pixels(bottomUp.size());
    for (size_t row = 0; row < size_t(height); ++row)
        std::memcpy(&pixels[row * rowSize], &bottomUp[(size_t(height) - 1 - row) * rowSize], rowSize);
    return pixels;
}

bool writePng(const std::string& path, int width, int height, const uint8_t* rgba, std::string&)
{
    takePicture(path.c_str(), width, height, rgba);
    return true;
}

} // namespace headless
