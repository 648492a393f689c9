#include "picker.h"

#include "scenemeshes.h"
#include "solidvisitor.h"

#include "orv/appearance.h"
#include "orv/mesh.h"

#include <algorithm>
#include <limits>

namespace view
{

using orv::Matrix4f;
using orv::Ray;
using orv::Vector3f;

namespace
{

enum class Sides
{
    NONE,
    FRONT, ///< those whose corners are counter-clockwise, seen along the ray
    BACK,
    BOTH
};

/// The sides of a solid's triangles, as they lie in the world, that are drawn.
Sides getDrawnSides(const orv::Solid& solid)
{
    if (!solid.getAppearance())
        return Sides::NONE;
    const orv::RenderState& state = solid.getAppearance()->getRenderState();
    switch (state.cullingMode)
    {
    case orv::CullingMode::CULL_NONE: return Sides::BOTH;
    case orv::CullingMode::CULL_FRONT_AND_BACK: return Sides::NONE;
    default: break;
    }
    const bool drawsFront = state.cullingMode == orv::CullingMode::CULL_BACK;
    const bool isClockwise =
        (state.windingOrder == orv::WindingOrder::WINDING_CW) != solid.getWorldMirrored();
    return drawsFront != isClockwise ? Sides::FRONT : Sides::BACK;
}

/// @param distance  along the ray; a meeting beyond it does not count.
/// @return false, with distance unchanged, if the triangle is not met.
bool meets(const Ray& ray, const Vector3f& a, const Vector3f& b, const Vector3f& c, Sides sides,
           float& distance)
{
    const Vector3f ab = b - a;
    const Vector3f ac = c - a;
    const Vector3f perpendicular = cross(ray.direction, ac);
    const float determinant = dot(ab, perpendicular); // above 0: counter-clockwise
    if (determinant == 0.0f || (sides == Sides::FRONT && determinant < 0.0f) ||
        (sides == Sides::BACK && determinant > 0.0f))
        return false;
    const Vector3f start = ray.position - a;
    const float u = dot(start, perpendicular) / determinant;
    if (!(u >= 0.0f && u <= 1.0f))
        return false;
    const Vector3f other = cross(start, ab);
    const float v = dot(ray.direction, other) / determinant;
    const float found = dot(ac, other) / determinant;
    if (!(v >= 0.0f && u + v <= 1.0f && found >= 0.0f && found < distance))
        return false;
    distance = found;
    return true;
}

bool meets(const Ray& ray, const Vector3f& centre, float radius)
{
    const Vector3f towards = centre - ray.position;
    const float along = std::max(dot(towards, ray.direction), 0.0f);
    const Vector3f beside = towards - ray.direction * along;
    return dot(beside, beside) <= radius * radius;
}

float getLargestScale(const Matrix4f& transform)
{
    return std::max({length(transform[0].xyz()), length(transform[1].xyz()), length(transform[2].xyz())});
}

bool pick(const SceneMeshes& meshes, const orv::Solid& solid, const Ray& ray, std::vector<Vector3f>& places,
          float& distance)
{
    const MeshTriangles* mesh = meshes.find(solid.getMesh().get());
    const Sides sides = getDrawnSides(solid);
    if (!mesh || sides == Sides::NONE)
        return false;
    const Matrix4f& toWorld = solid.getWorldTransform();
    const float radius = solid.getMesh()->getHeader().boundingRadius * getLargestScale(toWorld);
    if (solid.getJointCount() == 0 && radius >= 0.0f && !meets(ray, toWorld[3].xyz(), radius))
        return false;

    meshes.placeVertices(solid, places);
    const std::vector<uint16_t>& corners = mesh->indices;
    bool isMet = false;
    for (size_t i = 0; i < corners.size(); i += 3)
        isMet |=
            meets(ray, places[corners[i]], places[corners[i + 1]], places[corners[i + 2]], sides, distance);
    return isMet;
}

} // namespace

Hit pick(const SceneMeshes& meshes, orv::SceneNode& scene, const Ray& ray)
{
    std::vector<Vector3f> places;
    Hit hit;
    hit.distance = std::numeric_limits<float>::max();
    forEachSolid(scene,
                 [&](orv::Solid& solid)
                 {
                     if (pick(meshes, solid, ray, places, hit.distance))
                         hit.solid = &solid;
                 });
    return hit.solid ? hit : Hit();
}

} // namespace view
