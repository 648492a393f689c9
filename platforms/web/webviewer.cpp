#include "webviewer.h"

#include <emscripten/html5.h>

namespace web
{

bool WebViewer::start(const std::string& canvas)
{
    m_canvas = canvas;
    return makeContext() && takeContext();
}

bool WebViewer::makeContext()
{
    EmscriptenWebGLContextAttributes attributes;
    emscripten_webgl_init_context_attributes(&attributes);
    attributes.alpha = false; // the canvas is opaque
    attributes.stencil = true;
    attributes.majorVersion = 1;
    m_context = int(emscripten_webgl_create_context(m_canvas.c_str(), &attributes));
    return m_context > 0 && emscripten_webgl_make_context_current(m_context) == EMSCRIPTEN_RESULT_SUCCESS;
}

void WebViewer::dropContext()
{
    loseContext();
    if (m_context > 0)
        emscripten_webgl_destroy_context(m_context);
    m_context = 0;
}

bool WebViewer::restoreContext()
{
    if (!makeContext())
    {
        setError("the browser does not restore the WebGL context");
        return false;
    }
    return takeContext();
}

void WebViewer::setCanvasSize(int width, int height)
{
    setSize(width, height);
    emscripten_set_canvas_element_size(m_canvas.c_str(), getWidth(), getHeight());
}

} // namespace web
