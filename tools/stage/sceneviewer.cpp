#include "sceneviewer.h"

#include "scenesize.h"

#include "orv/assetcachepool.h"

#include <algorithm>
#include <cmath>
#include <filesystem>

namespace view
{

namespace
{

constexpr size_t MOST_REMARKS = 50;
constexpr float LONGEST_STEP = 0.25f;       // seconds of playing
constexpr float SHADER_TIME_SPAN = 3600.0f; // seconds; more would be too coarse for floats
const orv::Colour4f BACKGROUND(0.84f, 0.86f, 0.89f, 1.0f);

} // namespace

void SceneViewer::takeRemark(orv::LogLevel level, const char* place, const char* text, void* user)
{
    SceneViewer& viewer = *static_cast<SceneViewer*>(user);
    if (viewer.m_remarks.size() < MOST_REMARKS)
        viewer.m_remarks.push_back({level == orv::LogLevel::ERROR, text});
    if (viewer.m_log)
        viewer.m_log(level, place, text, nullptr);
}

SceneViewer::SceneViewer(orv::LogFunction log) : m_log(log), m_background(BACKGROUND)
{
    orv::setLogLevel(orv::LogLevel::WARNING);
    orv::setLogFunction(takeRemark, this);
}

SceneViewer::~SceneViewer()
{
    close();
    m_studio.reset();
    orv::setLogFunction(nullptr);
}

void SceneViewer::addSource(const orv::SharedPtr<orv::StreamSource>& source)
{
    m_sources.push_back(source);
}

bool SceneViewer::takeContext()
{
    m_studio = std::make_unique<Studio>();
    for (const orv::SharedPtr<orv::StreamSource>& source : m_sources)
        m_studio->addSource(source);
    return m_file.path.empty() || load();
}

void SceneViewer::loseContext()
{
    if (m_studio)
        m_studio->getPool()->forgetContext(); // so that no lost object is deleted
    m_stage.reset();
    m_studio.reset();
}

bool SceneViewer::open(const SceneFile& file)
{
    close();
    if (!m_studio)
    {
        m_error = "the GL context is lost";
        return false;
    }
    m_file = file;
    if (!load())
    {
        m_file = {};
        return false;
    }
    frameAll();
    return true;
}

void SceneViewer::close()
{
    m_file = {};
    m_error.clear();
    m_remarks.clear();
    m_player.reset();
    m_stage.reset();
    m_shaderTime = 0.0f;
    if (!m_studio)
        return;
    m_studio->limitFolders({}); // another scene's folder may have files of the same name
    m_studio->forgetAssets();
    m_studio->flush();
}

bool SceneViewer::load()
{
    m_error.clear();
    m_remarks.clear();
    m_studio->forgetAssets();
    m_stage = Stage::load(*m_studio, m_file, m_error);
    m_studio->flush(); // left over from a failed load
    if (!m_stage)
    {
        m_player.reset();
        return false;
    }
    m_stage->setBackground(m_background);
    const SceneSize size = measureScene(m_stage->getScene());
    m_parts = size.solids;
    m_triangles = size.triangles;
    auto player = std::make_unique<Player>(m_stage->getAnimation(), m_stage->getClips());
    const bool goesOn = bool(m_player);
    if (goesOn)
        player->continueFrom(*m_player);
    m_player = std::move(player);
    if (goesOn)
    {
        const int camera = m_eye.getCamera();
        m_eye.adopt(*m_stage, *m_player, "", m_width, m_height);
        m_eye.useCamera(*m_stage, camera);
    }
    return true;
}

std::vector<std::string> SceneViewer::listMissing() const
{
    std::vector<std::string> missing;
    std::error_code ignored;
    for (const std::string& file : m_studio ? m_studio->getAskedFiles() : std::set<std::string>())
    {
        if (!std::filesystem::exists(file, ignored))
            missing.push_back(file);
    }
    return missing;
}

void SceneViewer::setSize(int width, int height)
{
    m_width = std::max(width, 1);
    m_height = std::max(height, 1);
}

bool SceneViewer::draw(float seconds)
{
    if (!m_stage)
        return false;
    const float step = std::clamp(seconds, 0.0f, LONGEST_STEP);
    m_player->update(step);
    m_shaderTime = std::fmod(m_shaderTime + step, SHADER_TIME_SPAN);
    m_stage->setShaderTime(m_shaderTime);
    m_eye.apply(*m_stage);
    const orv::FrameCounters before = orv::countGlCalls();
    m_stage->draw(m_width, m_height);
    m_counters = orv::countGlCalls() - before;
    return m_player->isMoving() || m_stage->usesShaderTime();
}

void SceneViewer::frameAll()
{
    m_eye.frameAll(*m_stage, *m_player, m_width, m_height);
}

void SceneViewer::useCamera(int index)
{
    m_eye.useCamera(*m_stage, index);
}

void SceneViewer::turn(float right, float down)
{
    m_eye.turn(*m_stage, right, down);
}

void SceneViewer::pan(float right, float down)
{
    m_eye.pan(*m_stage, right, down, float(std::min(m_width, m_height)));
}

void SceneViewer::zoom(float steps)
{
    m_eye.zoom(*m_stage, steps);
}

void SceneViewer::lookCloser(float x, float y)
{
    m_eye.apply(*m_stage); // before the first frame, or after a turn, the camera is elsewhere
    m_eye.lookCloser(*m_stage, x, y, m_width, m_height);
}

void SceneViewer::setBackground(const orv::Colour4f& colour)
{
    m_background = colour;
    if (m_stage)
        m_stage->setBackground(colour);
}

} // namespace view
