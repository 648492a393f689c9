#include "eyecontrol.h"

#include "framing.h"

#include "orv/picking.h"
#include "orv/ray.h"

namespace view
{

namespace
{

constexpr size_t FRAMED_MOMENTS = 8;
constexpr float CLOSER_STEPS = 5.0f;

/// Shows the whole scene over the whole clip.
Orbit findView(Stage& stage, Player& player, int width, int height)
{
    const float time = player.getTime();
    const Clip& clip = player.getClip();
    std::vector<Shot> moments;
    for (size_t i = 0; i < FRAMED_MOMENTS && (i == 0 || clip.end > clip.start); ++i)
        moments.push_back({clip.start + (clip.end - clip.start) * float(i) / float(FRAMED_MOMENTS), 0.0f});
    const Orbit orbit = frameScene(stage, player, moments, width, height);
    player.seek(time);
    return orbit;
}

} // namespace

void EyeControl::frameAll(Stage& stage, Player& player, int width, int height)
{
    m_orbit = findView(stage, player, width, height);
    useCamera(stage, -1);
}

void EyeControl::adopt(Stage& stage, Player& player, const std::string& camera, int width, int height)
{
    std::string error;
    m_camera = camera.empty() ? -1 : stage.findCamera(camera, error);
    if (m_camera >= 0)
        stage.useCamera(m_camera);
    const Orbit whole = findView(stage, player, width, height); // it may be larger, or elsewhere
    m_orbit.centre = whole.centre;
    m_orbit.radius = whole.radius;
}

void EyeControl::useCamera(Stage& stage, int index)
{
    m_camera = index;
    if (m_camera >= 0)
        stage.useCamera(m_camera);
    else
        stage.useFreeCamera();
}

bool EyeControl::stepCamera(Stage& stage, int count)
{
    const int cameras = stage.getCameraCount() + 1; // with the free one, before the first
    useCamera(stage, (m_camera + 1 + count + cameras) % cameras - 1);
    return cameras > 1;
}

std::string EyeControl::getCameraName(const Stage& stage) const
{
    return m_camera >= 0 ? stage.getCameraName(m_camera) : std::string();
}

void EyeControl::zoom(Stage& stage, float steps)
{
    leaveFileCamera(stage);
    m_orbit.zoom(steps);
}

void EyeControl::turn(Stage& stage, float right, float down)
{
    leaveFileCamera(stage);
    m_orbit.turn(right, down);
}

void EyeControl::pan(Stage& stage, float right, float down, float viewSize)
{
    leaveFileCamera(stage);
    m_orbit.pan(right, down, viewSize);
}

void EyeControl::lookCloser(Stage& stage, float x, float y, int width, int height)
{
    const orv::Ray ray = castThrough(stage.getCamera(), x, y, float(width), float(height));
    const std::vector<orv::PickHit> hits = orv::pick(stage.getScene(), ray);
    if (hits.empty())
        return;
    leaveFileCamera(stage);
    m_orbit.middle = hits.front().point;
    m_orbit.distance = length(m_orbit.middle - stage.getCamera().getWorldTransform()[3].xyz());
    m_orbit.zoom(CLOSER_STEPS);
}

void EyeControl::apply(Stage& stage) const
{
    if (m_camera < 0)
        m_orbit.apply(stage.getFreeCamera());
}

void EyeControl::leaveFileCamera(Stage& stage)
{
    if (m_camera < 0)
        return;
    m_orbit.continueFrom(stage.getCamera());
    useCamera(stage, -1);
}

} // namespace view
