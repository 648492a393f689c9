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

/// The nearest hit of a ray on a solid.
struct PickHit
{
    SharedPtr<Solid> solid; ///< The solid that was hit.
    uint32_t triangle = 0;  ///< of the solid's mesh, counted from 0 in the order of drawing
    Vector3f point;         ///< in the world
    float distance = 0.0f;  ///< world units from the ray's start
};

/// Finds the nearest triangle of each solid that a ray hits, skinned ones in their current pose. Culled sides
/// (RenderState::cullingMode), points, lines, and meshes that do not keep their geometry (Mesh::getGeometry()) or whose
/// index buffer is disabled are ignored. A mesh of 100,000 triangles takes some microseconds; the first call builds a tree of its triangles. For
/// skinned solids each triangle is tested.
/// @param ray  in the world, with a direction of any length; one without direction hits nothing.
/// @param flags  which nodes take part, by their own flags and those above; as RenderBlock::setRenderFlags() has them.
///               SceneNode::VISIBLE leaves out hidden nodes.
/// @return the nearest first.
ORV_API std::vector<PickHit> pick(SceneNode& scene, const Ray& ray, const FlagMask& flags = FlagMask());

} // namespace orv
