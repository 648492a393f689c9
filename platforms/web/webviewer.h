#pragma once

#include "stage/eyecontrol.h"
#include "stage/player.h"
#include "stage/stage.h"
#include "stage/studio.h"

#include "orv/framecounters.h"

#include <memory>
#include <string>
#include <vector>

namespace web
{

/// One scene on the canvas of a page, and its camera.
///
/// The page first writes the files of a scene into the program's in-memory file system. Only draw() draws: the page
/// requests a frame when something changes or moves.
class WebViewer
{
public:
    /// The engine's messages about a load.
    struct Remark
    {
        bool isError;
        std::string text;
    };

    WebViewer();
    ~WebViewer();

    WebViewer(const WebViewer&) = delete;
    WebViewer& operator=(const WebViewer&) = delete;

    /// Makes the canvas's context. @param canvas  a CSS selector, of an element without a context.
    /// @return false if the browser has no WebGL for it.
    bool start(const std::string& canvas);

    /// The context is lost; draw() does nothing from now on.
    void loseContext();
    /// The context is restored: loads the scene again and continues with the same eye, clip and time.
    /// @return false, with nothing shown, if that failed.
    bool restoreContext();

    /// Shows a scene, a material or a shader program.
    /// @param path  in the in-memory file system; files that it names are searched beside it.
    /// @return false, with the reason in getError() and nothing shown, if it cannot be loaded.
    bool open(const std::string& path);
    void close();
    bool isOpen() const { return bool(m_stage); }

    const std::string& getError() const { return m_error; }
    const std::vector<Remark>& getRemarks() const { return m_remarks; }
    /// Missing files that the scene requested, including optional variants.
    std::vector<std::string> listMissing() const;

    void setSize(int width, int height); ///< of the canvas, in pixels

    /// Advances the time and draws. @param seconds  since the last call; long times are shortened.
    /// @return whether something moves, so that the next frame would differ.
    bool draw(float seconds);

    /// Statistics of the last draw().
    const orv::FrameCounters& getCounters() const { return m_counters; }
    long getTriangleCount() const { return m_triangles; }
    int getPartCount() const { return m_parts; }

    // The following functions need an open scene.

    view::Stage& getStage() { return *m_stage; }
    view::Player& getPlayer() { return *m_player; }

    void frameAll();
    void useCamera(int index); ///< of the file; -1 for the free one
    int getCamera() const { return m_eye.getCamera(); }
    void turn(float right, float down); ///< pixels of the page
    void pan(float right, float down);  ///< pixels of the canvas
    void zoom(float steps);
    void lookCloser(float x, float y); ///< pixels of the canvas
    void setBackground(const orv::Colour4f& colour);

private:
    bool makeContext();
    bool load();

    std::string m_canvas;
    int m_context = 0; ///< Emscripten's handle
    std::string m_path;
    std::string m_error;
    std::vector<Remark> m_remarks;
    std::unique_ptr<view::Studio> m_studio;
    std::unique_ptr<view::Stage> m_stage;
    std::unique_ptr<view::Player> m_player;
    view::EyeControl m_eye;
    orv::Colour4f m_background;
    int m_width = 1;
    int m_height = 1;
    int m_parts = 0;
    long m_triangles = 0;
    float m_shaderTime = 0.0f;
    orv::FrameCounters m_counters;
};

} // namespace web
