#include "framing.h"

#include "solidvisitor.h"
#include "stage.h"

#include "orv/mesh.h"
#include "orv/scenebounds.h"

#include <algorithm>
#include <cmath>

namespace view
{

using orv::Matrix4f;
using orv::Vector3f;
using orv::Vector4f;

namespace
{

const Vector3f VIEW_DIRECTION(0.5f, 0.4f, 1.0f); // towards the eye

constexpr float FILLED_SHARE = 0.9f;  // of the view, by the scene
constexpr float GOOD_ENOUGH = 0.005f; // sum of the errors of centre and share
constexpr int MAX_ROUNDS = 8;
constexpr size_t MAX_SHOTS = 8;

/// Evenly distributed on a sphere, along a spiral from pole to pole.
void spreadOverSphere(float radius, std::vector<Vector3f>& positions)
{
    constexpr int COUNT = 400;
    constexpr float GOLDEN_ANGLE = 2.3999632f;
    for (int i = 0; i < COUNT; ++i)
    {
        const float height = 1.0f - 2.0f * (float(i) + 0.5f) / float(COUNT);
        const float side = std::sqrt(1.0f - height * height);
        const float angle = GOLDEN_ANGLE * float(i);
        positions.push_back(Vector3f(side * std::cos(angle), height, side * std::sin(angle)) * radius);
    }
}

/// The current positions of a solid's vertices in the world; if its mesh keeps none, points on its bounding sphere.
void findPlaces(const orv::Solid& solid, std::vector<Vector3f>& places)
{
    if (orv::placeVertices(solid, places) || !solid.getMesh())
        return;
    spreadOverSphere(std::max(solid.getMesh()->getHeader().boundingRadius, 0.0f), places);
    for (Vector3f& place : places)
        place = (solid.getWorldTransform() * Vector4f(place, 1.0f)).xyz();
}

/// An axis-aligned box around everything added.
struct Extent
{
    Vector3f lowest;
    Vector3f highest;
    bool isEmpty = true;

    void add(const Vector3f& place)
    {
        if (!std::isfinite(place.x + place.y + place.z))
            return;
        for (int axis = 0; axis < 3; ++axis)
        {
            lowest[axis] = isEmpty ? place[axis] : std::min(lowest[axis], place[axis]);
            highest[axis] = isEmpty ? place[axis] : std::max(highest[axis], place[axis]);
        }
        isEmpty = false;
    }

    Vector3f centre() const { return (lowest + highest) * 0.5f; }
    float radius() const { return length(highest - lowest) * 0.5f; } ///< of the sphere around the box
};

/// Finds the view iteratively, since perspective changes with each step.
class Framer
{
public:
    Framer(Stage& stage, Player& player, const std::vector<Shot>& shots, int width, int height);

    Orbit frame();

private:
    template <class Operation>
    void forEachPlace(const Shot& shot, const Operation& operation);
    Extent findCoverage();

    Stage& m_stage;
    Player& m_player;
    std::vector<Shot> m_shots;
    bool m_goesAround = false;
    float m_halfWidth; ///< of the view, at a distance of 1
    float m_halfHeight;
    Orbit m_orbit;
    std::vector<Vector3f> m_places; ///< of one solid; kept for its memory
};

Framer::Framer(Stage& stage, Player& player, const std::vector<Shot>& shots, int width, int height)
    : m_stage(stage)
    , m_player(player)
{
    const float aspect = float(width) / float(height);
    const float spread = std::tan(m_orbit.fieldOfView.radians() / 2.0f);
    m_halfWidth = spread * std::max(aspect, 1.0f);
    m_halfHeight = spread * std::max(1.0f / aspect, 1.0f);

    const size_t step = (shots.size() + MAX_SHOTS - 1) / MAX_SHOTS;
    for (size_t i = 0; i < shots.size(); ++i)
    {
        if (i % step == 0 || i + 1 == shots.size())
            m_shots.push_back(shots[i]);
        m_goesAround = m_goesAround || shots[i].turn != 0.0f;
    }
    Extent box;
    for (const Shot& shot : m_shots)
        forEachPlace(shot, [&box](const Vector3f& place) { box.add(place); });
    m_orbit.radius = std::max(box.radius(), 1e-6f);
    m_orbit.centre = box.centre();
    m_orbit.middle = m_orbit.centre;
    m_orbit.setDirection(VIEW_DIRECTION);
}

template <class Operation>
void Framer::forEachPlace(const Shot& shot, const Operation& operation)
{
    m_player.seek(shot.time);
    forEachSolid(m_stage.getScene(),
                 [&](orv::Solid& solid)
                 {
                     findPlaces(solid, m_places);
                     for (const Vector3f& place : m_places)
                         operation(place);
                 });
}

/// The scene's extent in the view: -1 to 1 from left to right and from bottom to top.
Extent Framer::findCoverage()
{
    Extent seen;
    for (const Shot& shot : m_shots)
    {
        Orbit orbit = m_orbit;
        orbit.yaw += shot.turn;
        const Vector3f eye = orbit.getEye();
        const Matrix4f axes = lookAt(eye, orbit.middle, Vector3f::Y_AXIS);
        const Vector3f right = axes[0].xyz() / m_halfWidth;
        const Vector3f up = axes[1].xyz() / m_halfHeight;
        const Vector3f back = axes[2].xyz();
        const float nearest = orbit.distance / 100.0f; // the near distance of a camera there
        forEachPlace(shot,
                     [&](const Vector3f& place)
                     {
                         const Vector3f seenFrom = place - eye;
                         const float depth = std::max(-dot(seenFrom, back), nearest);
                         seen.add(Vector3f(dot(seenFrom, right) / depth, dot(seenFrom, up) / depth, 0.0f));
                     });
    }
    if (m_goesAround && !seen.isEmpty) // the orbited point stays in the centre
    {
        seen.highest.x = std::max(seen.highest.x, -seen.lowest.x);
        seen.lowest.x = -seen.highest.x;
    }
    return seen;
}

Orbit Framer::frame()
{
    m_orbit.distance = m_orbit.radius / std::sin(m_orbit.fieldOfView.radians() / 2.0f);
    for (int round = 0; round < MAX_ROUNDS; ++round)
    {
        const Extent seen = findCoverage();
        const Vector3f off = seen.centre();
        const float share = std::max(seen.highest.x - seen.lowest.x, seen.highest.y - seen.lowest.y) / 2.0f;
        if (!(share > 0.0f) ||
            std::abs(off.x) + std::abs(off.y) + std::abs(share - FILLED_SHARE) < GOOD_ENOUGH)
            break;
        const Matrix4f axes = lookAt(m_orbit.getEye(), m_orbit.middle, Vector3f::Y_AXIS);
        const Vector3f up = m_goesAround ? Vector3f::Y_AXIS : axes[1].xyz();
        m_orbit.middle += axes[0].xyz() * (off.x * m_halfWidth * m_orbit.distance) +
                          up * (off.y * m_halfHeight * m_orbit.distance);
        m_orbit.distance *= share / FILLED_SHARE;
    }
    return m_orbit;
}

} // namespace

Orbit frameScene(Stage& stage, Player& player, const std::vector<Shot>& shots, int width, int height)
{
    return Framer(stage, player, shots, width, height).frame();
}

} // namespace view
