#pragma once

#include "orv/angle.h"
#include "orv/camera.h"
#include "orv/ray.h"
#include "orv/vector.h"

namespace view
{

/// An eye that orbits a point, controlled by mouse movements.
///
/// The eye is `distance` away from `middle`, turned about the upward axis by `yaw` (0: on the +z side, more: towards
/// +x) and raised by `pitch`. Angles in radians, lengths in world units.
struct Orbit
{
    static constexpr float ZOOM_STEP = 0.9f; ///< what one step of zooming leaves of the distance

    orv::Vector3f middle;
    float yaw = 0.0f;
    float pitch = 0.0f;
    float distance = 1.0f; ///< above 0
    orv::Anglef fieldOfView = orv::Anglef::fromDegrees(40.0f);

    orv::Vector3f centre; ///< of a sphere around everything that may be visible
    float radius = 1.0f;  ///< of the same, above 0

    orv::Vector3f getDirection() const; ///< from the middle towards the eye, of unit length
    orv::Vector3f getEye() const { return middle + getDirection() * distance; }
    void setDirection(const orv::Vector3f& towardsEye); ///< of any length but 0

    /// Turns the scene as if dragged by pixels to the right and down, half a degree for each.
    void turn(float right, float down);

    /// Moves the view so that points at the middle's depth follow the pointer.
    /// @param viewHeight  the shorter side of the view, in pixels.
    void pan(float right, float down, float viewHeight);

    /// A tenth nearer with each step; between a millionth and a thousand times the scene's size.
    void zoom(float steps);

    /// Continues from a camera's position, around a point straight ahead at the old distance.
    void continueFrom(const orv::Camera& camera);

    /// Places a camera, whose parents must not move it, at the eye. Its near and far distance enclose the scene.
    void apply(orv::Camera& camera) const;
};

/// The ray from a camera through a point of its view.
/// @param x, y  in pixels from the upper left corner.
orv::Ray castThrough(orv::Camera& camera, float x, float y, float width, float height);

} // namespace view
