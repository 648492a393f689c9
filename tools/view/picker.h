#pragma once

#include "orv/ray.h"
#include "orv/solid.h"

namespace view
{

class SceneMeshes;

/// What a ray meets first.
struct Hit
{
    orv::Solid* solid = nullptr; ///< borrowed from the scene; null if nothing was met
    float distance = 0.0f;       ///< world units along the ray
};

/// Goes through a scene triangle by triangle: skinned solids as their joints hold them at the moment, without the
/// sides that are not drawn. Points and lines are not met.
/// @param ray  in the world, with a direction of unit length.
Hit pick(const SceneMeshes& meshes, orv::SceneNode& scene, const orv::Ray& ray);

} // namespace view
