#pragma once

#include "orv/export.h"
#include "orv/flagmask.h"
#include "orv/sharedptr.h"
#include "orv/solid.h"
#include "orv/vector.h"

#include <cstdint>
#include <vector>

namespace orv
{

class SceneNode;
struct Ray;

/// What a ray meets of a solid first.
struct PickHit
{
    SharedPtr<Solid> solid; ///< What was met.
    uint32_t triangle = 0;  ///< of the solid's mesh, counted from 0 in the order of drawing
    Vector3f point;         ///< in the world
    float distance = 0.0f;  ///< world units from the ray's start
};

/// Finds what a ray meets: the nearest triangle of each solid, skinned ones as their joints hold them at the moment. Sides
/// that are not drawn (RenderState::cullingMode) are not met, nor are points, lines, and meshes that do not keep their
/// geometry (Mesh::getGeometry()). A look at a mesh of 100,000 triangles takes some microseconds; the first one sorts its
/// triangles. Solids with joints are gone through triangle by triangle.
/// @param ray  in the world, with a direction of any length; one without direction meets nothing.
/// @param flags  which nodes take part, by their own flags and those above; as RenderBlock::setRenderFlags() has them.
///               SceneNode::VISIBLE leaves out what is hidden.
/// @return the nearest first.
ORV_API std::vector<PickHit> pick(SceneNode& scene, const Ray& ray, const FlagMask& flags = FlagMask());

} // namespace orv
