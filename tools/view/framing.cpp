#include "framing.h"

#include "scenebounds.h"
#include "stage.h"

#include "headless/headless.h"

#include "orv/sceneutil.h"

#include <algorithm>
#include <cmath>

using orv::Vector3f;

namespace
{

const Vector3f VIEW_DIRECTION = normalize(Vector3f(0.5f, 0.4f, 1.0f)); // towards the eye
const orv::Anglef FIELD_OF_VIEW = orv::Anglef::fromDegrees(40.0f);

const float FILLED_SHARE = 0.9f; // of the view, by the scene
const float GOOD_ENOUGH = 0.02f; // off the centre and off that share together
const int MAX_ROUNDS = 8;
const size_t MAX_TIMES = 8;
const int MAX_EDGE = 256; // pixels of the views that are only looked at here

/// No material is likely to have it; seen where the scene is not.
const uint8_t EMPTY[] = {255, 0, 254};

/// Where the scene shows in the view, from -1 to 1 from left to right and from bottom to top.
struct Coverage
{
    float left = 1.0f;
    float right = -1.0f;
    float bottom = 1.0f;
    float top = -1.0f;

    bool isEmpty() const { return left > right; }
    float centreX() const { return (left + right) / 2.0f; }
    float centreY() const { return (bottom + top) / 2.0f; }
    float share() const { return std::max(right - left, top - bottom) / 2.0f; }
};

/// Finds the view step by step. Bounding spheres lie around the meshes' origins, which may be far from their
/// middles, so they give the first views only; the others come from where the scene shows in those.
class Framer
{
public:
    Framer(Stage& stage, const std::vector<float>& times, int width, int height);

    void frame();

private:
    Coverage findCoverage() const;
    void lookFrom(const Vector3f& direction, float distance);
    void findMiddle();
    void fillView();

    /// Half of what the view spans at the middle, in world units.
    float halfWidth(float shorterHalf) const { return shorterHalf * std::max(m_aspect, 1.0f); }
    float halfHeight(float shorterHalf) const { return shorterHalf * std::max(1.0f / m_aspect, 1.0f); }

    Stage& m_stage;
    std::vector<float> m_times;
    int m_width;
    int m_height;
    float m_aspect;
    SceneBounds m_bounds;
    float m_radius; // around everything, above 0
    Vector3f m_middle;
    orv::Camera::Ptr m_camera = orv::makeShared<orv::Camera>();
};

Framer::Framer(Stage& stage, const std::vector<float>& times, int width, int height)
    : m_stage(stage)
    , m_width(std::max(1, width / (1 + std::max(width, height) / MAX_EDGE)))
    , m_height(std::max(1, height / (1 + std::max(width, height) / MAX_EDGE)))
    , m_aspect(float(m_width) / float(m_height))
{
    const size_t step = (times.size() + MAX_TIMES - 1) / MAX_TIMES;
    for (size_t i = 0; i < times.size(); ++i)
    {
        stage.setTime(times[i]);
        m_bounds.add(stage.getScene());
        if (i % step == 0 || i + 1 == times.size())
            m_times.push_back(times[i]);
    }
    m_radius = std::max(m_bounds.radius(), 1e-6f);
    m_middle = m_bounds.centre();
    stage.addCamera(m_camera);
    stage.draw(times.front(), width, height); // a mirror's picture keeps the size of the first frame
}

Coverage Framer::findCoverage() const
{
    Coverage seen;
    for (float time : m_times)
    {
        m_stage.draw(time, m_width, m_height);
        const std::vector<uint8_t> pixels = headless::readFramebuffer(0, 0, m_width, m_height);
        for (int i = 0; i < m_width * m_height; ++i)
        {
            if (std::equal(EMPTY, EMPTY + 3, &pixels[size_t(i) * 4]))
                continue;
            const int x = i % m_width;
            const int y = m_height - 1 - i / m_width;
            seen.left = std::min(seen.left, float(x) / float(m_width) * 2.0f - 1.0f);
            seen.right = std::max(seen.right, float(x + 1) / float(m_width) * 2.0f - 1.0f);
            seen.bottom = std::min(seen.bottom, float(y) / float(m_height) * 2.0f - 1.0f);
            seen.top = std::max(seen.top, float(y + 1) / float(m_height) * 2.0f - 1.0f);
        }
    }
    return seen;
}

void Framer::lookFrom(const Vector3f& direction, float distance)
{
    const Vector3f eye = m_middle + direction * distance;
    const float depth = dot(eye - m_bounds.centre(), direction);
    m_camera->setNear(std::max(depth - m_radius, distance / 100.0f));
    m_camera->setFar(std::max(depth + m_radius, distance * 1.01f));
    m_camera->setPosition(eye);
    orv::point(*m_camera, m_middle);
}

/// Moves the middle to where the scene is, its depth included, by two parallel projections: in the second one,
/// turned by 45 degrees about the view's upward axis, depth shows as a shift to the side.
void Framer::findMiddle()
{
    m_camera->setProjectionType(orv::Camera::ProjectionType::ORTHOGRAPHIC);
    m_camera->setWidth(2.0f * halfWidth(m_radius));

    lookFrom(VIEW_DIRECTION, 2.0f * m_radius);
    const Coverage straight = findCoverage();
    const Vector3f right = m_camera->getWorldTransform()[0].xyz();
    const Vector3f up = m_camera->getWorldTransform()[1].xyz();
    if (!straight.isEmpty())
    {
        m_middle += right * (straight.centreX() * halfWidth(m_radius)) +
                    up * (straight.centreY() * halfHeight(m_radius));
        const Vector3f turned = normalize(VIEW_DIRECTION + right);
        lookFrom(turned, 2.0f * m_radius);
        const Coverage sideways = findCoverage();
        const Vector3f turnedRight = m_camera->getWorldTransform()[0].xyz();
        if (!sideways.isEmpty())
            m_middle += VIEW_DIRECTION *
                        (sideways.centreX() * halfWidth(m_radius) / dot(turnedRight, VIEW_DIRECTION));
    }
    m_camera->setProjectionType(orv::Camera::ProjectionType::PERSPECTIVE);
}

void Framer::fillView()
{
    const float spread = std::tan(FIELD_OF_VIEW.radians() / 2.0f);
    float distance = m_radius / std::sin(FIELD_OF_VIEW.radians() / 2.0f);
    m_camera->setFieldOfView(FIELD_OF_VIEW);
    lookFrom(VIEW_DIRECTION, distance);
    for (int round = 0; round < MAX_ROUNDS; ++round)
    {
        const Coverage seen = findCoverage();
        const float off = std::abs(seen.centreX()) + std::abs(seen.centreY());
        if (seen.isEmpty() || off + std::abs(seen.share() - FILLED_SHARE) < GOOD_ENOUGH)
            return;
        const orv::Matrix4f& toWorld = m_camera->getWorldTransform();
        m_middle += toWorld[0].xyz() * (seen.centreX() * halfWidth(distance * spread)) +
                    toWorld[1].xyz() * (seen.centreY() * halfHeight(distance * spread));
        distance *= seen.share() / FILLED_SHARE;
        lookFrom(VIEW_DIRECTION, distance);
    }
}

void Framer::frame()
{
    findMiddle();
    fillView();
}

} // namespace

void frameScene(Stage& stage, const std::vector<float>& times, int width, int height)
{
    const orv::Colour4f background = stage.getBackground();
    stage.setBackground(
        orv::Colour4f(float(EMPTY[0]) / 255.0f, float(EMPTY[1]) / 255.0f, float(EMPTY[2]) / 255.0f, 1.0f));
    Framer(stage, times, width, height).frame();
    stage.setBackground(background);
}
