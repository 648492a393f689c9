#include "webviewer.h"

#include "stage/scenesize.h"

#include "orv/assetcachepool.h"
#include "orv/logsink.h"

#include <algorithm>
#include <cmath>
#include <filesystem>

#include <emscripten/html5.h>

namespace web
{

namespace
{

constexpr size_t MOST_REMARKS = 50;
constexpr float LONGEST_STEP = 0.25f;       // seconds of playing
constexpr float SHADER_TIME_SPAN = 3600.0f; // seconds; more would be too coarse for floats
const orv::Colour4f BACKGROUND(0.84f, 0.86f, 0.89f, 1.0f);

void takeRemark(orv::LogLevel level, const char*, const char* text, void* user)
{
    auto& remarks = *static_cast<std::vector<WebViewer::Remark>*>(user);
    if (remarks.size() < MOST_REMARKS)
        remarks.push_back({level == orv::LogLevel::ERROR, text});
}

} // namespace

WebViewer::WebViewer() : m_background(BACKGROUND)
{
    orv::setLogLevel(orv::LogLevel::WARNING);
    orv::setLogFunction(takeRemark, &m_remarks);
}

WebViewer::~WebViewer()
{
    close();
    orv::setLogFunction(nullptr);
}

bool WebViewer::start(const std::string& canvas)
{
    m_canvas = canvas;
    return makeContext();
}

bool WebViewer::makeContext()
{
    EmscriptenWebGLContextAttributes attributes;
    emscripten_webgl_init_context_attributes(&attributes);
    attributes.alpha = false; // the canvas is opaque
    attributes.stencil = true;
    attributes.majorVersion = 1;
    m_context = int(emscripten_webgl_create_context(m_canvas.c_str(), &attributes));
    if (m_context <= 0 || emscripten_webgl_make_context_current(m_context) != EMSCRIPTEN_RESULT_SUCCESS)
        return false;
    m_studio = std::make_unique<view::Studio>();
    return true;
}

void WebViewer::loseContext()
{
    if (m_studio)
        m_studio->getPool()->forgetContext(); // so that no lost object is deleted
    m_stage.reset();
    m_studio.reset();
    if (m_context > 0)
        emscripten_webgl_destroy_context(m_context);
    m_context = 0;
}

bool WebViewer::restoreContext()
{
    if (!makeContext())
    {
        m_error = "the browser does not restore the WebGL context";
        return false;
    }
    return m_path.empty() || load();
}

bool WebViewer::open(const std::string& path)
{
    close();
    if (!m_studio)
    {
        m_error = "the WebGL context is lost";
        return false;
    }
    m_path = path;
    if (!load())
    {
        m_path.clear();
        return false;
    }
    frameAll();
    return true;
}

void WebViewer::close()
{
    m_path.clear();
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

bool WebViewer::load()
{
    m_error.clear();
    m_remarks.clear();
    m_studio->forgetAssets();
    m_stage = view::Stage::load(*m_studio, {m_path, {}}, m_error);
    m_studio->flush(); // left over from a failed load
    if (!m_stage)
    {
        m_player.reset();
        return false;
    }
    m_stage->setBackground(m_background);
    const view::SceneSize size = view::measureScene(m_stage->getScene());
    m_parts = size.solids;
    m_triangles = size.triangles;
    auto player = std::make_unique<view::Player>(m_stage->getAnimation(), m_stage->getClips());
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

std::vector<std::string> WebViewer::listMissing() const
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

void WebViewer::setSize(int width, int height)
{
    m_width = std::max(width, 1);
    m_height = std::max(height, 1);
    emscripten_set_canvas_element_size(m_canvas.c_str(), m_width, m_height);
}

bool WebViewer::draw(float seconds)
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

void WebViewer::frameAll()
{
    m_eye.frameAll(*m_stage, *m_player, m_width, m_height);
}

void WebViewer::useCamera(int index)
{
    m_eye.useCamera(*m_stage, index);
}

void WebViewer::turn(float right, float down)
{
    m_eye.turn(*m_stage, right, down);
}

void WebViewer::pan(float right, float down)
{
    m_eye.pan(*m_stage, right, down, float(std::min(m_width, m_height)));
}

void WebViewer::zoom(float steps)
{
    m_eye.zoom(*m_stage, steps);
}

void WebViewer::lookCloser(float x, float y)
{
    m_eye.apply(*m_stage); // before the first frame, or after a turn, the camera is elsewhere
    m_eye.lookCloser(*m_stage, x, y, m_width, m_height);
}

void WebViewer::setBackground(const orv::Colour4f& colour)
{
    m_background = colour;
    if (m_stage)
        m_stage->setBackground(colour);
}

} // namespace web
