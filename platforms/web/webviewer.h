#pragma once

#include "stage/sceneviewer.h"

#include <string>

namespace web
{

/// The viewer on the canvas of a page. The page first writes the files of a scene into the program's in-memory file
/// system. Only draw() draws: the page requests a frame when something changes or moves.
class WebViewer : public view::SceneViewer
{
public:
    /// Makes the canvas's context. @param canvas  a CSS selector, of an element without a context.
    /// @return false if the browser has no WebGL for it.
    bool start(const std::string& canvas);

    /// The context is lost; draw() does nothing from now on.
    void dropContext();
    /// The context is restored. @return as takeContext().
    bool restoreContext();

    void setCanvasSize(int width, int height); ///< in pixels

private:
    bool makeContext();

    std::string m_canvas;
    int m_context = 0; ///< Emscripten's handle
};

} // namespace web
