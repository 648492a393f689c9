#pragma once

#include "orv/angle.h"
#include "orv/camera.h"
#include "orv/ray.h"
#include "orv/vector.h"

namespace view
{

/// An eye that goes around a place: what a hand does with a mouse, as numbers.
///
/// The eye is `distance` away from `middle`, turned about the upward axis by `yaw` (0: on the +z side, more: towards
/// +x) and raised by `pitch`. Angles in radians, lengths in world units.
struct Orbit
{
    orv::Vector3f middle;
    float yaw = 0.0f;
    float pitch = 0.0f;
    float distance = 1.0f; ///< above 0
    orv::Anglef fieldOfView = orv::Anglef::fromDegrees(40.0f);

    orv::Vector3f centre; ///< of a sphere around everything that may show
    float radius = 1.0f;  ///< of the same, above 0

    orv::Vector3f getDirection() const; ///< from the middle towards the eye, of unit length
    orv::Vector3f getEye() const { return middle + getDirection() * distance; }
    void setDirection(const orv::Vector3f& towardsEye); ///< of any length but 0

    /// Turns what is seen as if dragged by pixels to the right and down, half a degree for each.
    void turn(float right, float down);

    /// Moves what is at the middle's depth along with the pointer.
    /// @param viewHeight  the shorter side of the view, in pixels.
    void pan(float right, float down, float viewHeight);

    /// A tenth nearer with each step; between a millionth and a thousand times the scene's size.
    void zoom(float steps);

    /// Goes on from where a camera stands, around what is straight ahead of it, as far away as the middle was.
    void continueFrom(const orv::Camera& camera);

    /// Puts a camera, which has no parent that moves it, in the eye's place. Its near and far take everything in.
    void apply(orv::Camera& camera) const;
};

/// The ray from a camera through a point of its view.
/// @param x, y  in pixels from the upper left corner.
orv::Ray castThrough(orv::Camera& camera, float x, float y, float width, float height);

} // namespace view
