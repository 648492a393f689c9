#pragma once

#include "eyecontrol.h"
#include "player.h"
#include "stage.h"
#include "studio.h"

#include "orv/framecounters.h"
#include "orv/logsink.h"

#include <memory>
#include <string>
#include <vector>

namespace view
{

/// One scene, the eye that looks at it, and the GL context that it is drawn in, which can be lost at any time.
///
/// Who derives from it or holds it makes contexts current. There is one of them at a time, since it takes the engine's
/// log. Nothing is drawn but by draw(): a frame is asked for where something has changed or moves.
class SceneViewer
{
public:
    /// What the engine had to say about a load.
    struct Remark
    {
        bool isError;
        std::string text;
    };

    /// @param log  gets every warning and error of the engine as well; null for none.
    explicit SceneViewer(orv::LogFunction log = nullptr);
    /// With the context current, or after loseContext().
    ~SceneViewer();

    SceneViewer(const SceneViewer&) = delete;
    SceneViewer& operator=(const SceneViewer&) = delete;

    /// Where scenes that are assets come from, with all that they name; from the next context on.
    void addSource(const orv::SharedPtr<orv::StreamSource>& source);

    /// A new context is current from here on. What was shown is loaded once more and goes on where it was, eye, clip, time
    /// and all.
    /// @return false, with the reason in getError() and nothing shown, if that failed.
    bool takeContext();
    /// The context is gone, with all that it held; draw() does nothing from here on. Makes no call of GL.
    void loseContext();

    /// Shows a scene, a material or a shader program in place of what was shown.
    /// @return false, with the reason in getError() and nothing shown, if it cannot be loaded.
    bool open(const SceneFile& file);
    void close();
    bool isOpen() const { return bool(m_stage); }

    const std::string& getError() const { return m_error; }
    const std::vector<Remark>& getRemarks() const { return m_remarks; }
    /// Files that the scene asked for and that were not there: what to look for elsewhere, and variants that need not be.
    std::vector<std::string> listMissing() const;

    void setSize(int width, int height); ///< of what is drawn into, in pixels

    /// Goes on by some time and draws. @param seconds  since the last call; less is played where that is long ago.
    /// @return whether something moves, so that the next frame would show something else.
    bool draw(float seconds);

    /// What the last draw() took.
    const orv::FrameCounters& getCounters() const { return m_counters; }
    long getTriangleCount() const { return m_triangles; }
    int getPartCount() const { return m_parts; }

    // For what follows, a scene has to be open.

    Stage& getStage() { return *m_stage; }
    Player& getPlayer() { return *m_player; }

    void frameAll();
    void useCamera(int index); ///< of the file; -1 for the free one
    void stepCamera(int count) { m_eye.stepCamera(*m_stage, count); }
    int getCamera() const { return m_eye.getCamera(); }
    void turn(float right, float down); ///< pixels of a middling screen, half a degree each
    void pan(float right, float down);  ///< pixels of what is drawn into
    void zoom(float steps);
    void lookCloser(float x, float y); ///< pixels of what is drawn into
    void setBackground(const orv::Colour4f& colour);

protected:
    int getWidth() const { return m_width; }
    int getHeight() const { return m_height; }
    void setError(const std::string& error) { m_error = error; }

private:
    static void takeRemark(orv::LogLevel level, const char* place, const char* text, void* user);
    bool load();

    orv::LogFunction m_log;
    std::vector<orv::SharedPtr<orv::StreamSource>> m_sources;
    SceneFile m_file; ///< without a path where nothing is shown
    std::string m_error;
    std::vector<Remark> m_remarks;
    std::unique_ptr<Studio> m_studio;
    std::unique_ptr<Stage> m_stage;
    std::unique_ptr<Player> m_player;
    EyeControl m_eye;
    orv::Colour4f m_background;
    int m_width = 1;
    int m_height = 1;
    int m_parts = 0;
    long m_triangles = 0;
    float m_shaderTime = 0.0f;
    orv::FrameCounters m_counters;
};

} // namespace view
