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

/// One scene, its camera, and its GL context, which can be lost at any time.
///
/// The owner makes contexts current. One object at a time, since it takes the engine's log. Only draw() draws: the
/// owner calls it when something changes or moves.
class SceneViewer
{
public:
    /// The engine's messages about a load.
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

    /// The source of scenes that are assets, with all files that they name; used from the next context on.
    void addSource(const orv::SharedPtr<orv::StreamSource>& source);

    /// A new context is current: loads the scene again and continues with the same eye, clip and time.
    /// @return false, with the reason in getError() and nothing shown, if that failed.
    bool takeContext();
    /// The context is lost; draw() does nothing from now on. Makes no GL call.
    void loseContext();

    /// Shows a scene, a material or a shader program.
    /// @return false, with the reason in getError() and nothing shown, if it cannot be loaded.
    bool open(const SceneFile& file);
    void close();
    bool isOpen() const { return bool(m_stage); }

    const std::string& getError() const { return m_error; }
    const std::vector<Remark>& getRemarks() const { return m_remarks; }
    /// Missing files that the scene requested, including optional variants.
    std::vector<std::string> listMissing() const;

    void setSize(int width, int height); ///< of the surface, in pixels

    /// Advances the time and draws. @param seconds  since the last call; long times are shortened.
    /// @return whether something moves, so that the next frame would differ.
    bool draw(float seconds);

    /// Statistics of the last draw().
    const orv::FrameCounters& getCounters() const { return m_counters; }
    long getTriangleCount() const { return m_triangles; }
    int getPartCount() const { return m_parts; }

    // The following functions need an open scene.

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
    SceneFile m_file; ///< without a path if nothing is shown
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
