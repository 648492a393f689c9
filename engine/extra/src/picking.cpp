#include "orv/picking.h"

#include "orv/appearance.h"
#include "orv/indexbuffer.h"
#include "orv/mesh.h"
#include "orv/meshgeometry.h"
#include "orv/meshrays.h"
#include "orv/ray.h"
#include "orv/scenebounds.h"
#include "orv/scenenodevisitor.h"
#include "orv/sceneutil.h"
#include "orv/solid.h"

#include <algorithm>
#include <cmath>
#include <limits>

namespace orv
{

namespace
{

/// The sides of a solid's triangles, as its mesh has them, that are drawn.
/// @param isTurned  the transform to the ray's space mirrors.
TriangleSides getDrawnSides(const Appearance& appearance, bool isMirrored, bool isTurned)
{
    const RenderState& state = appearance.getRenderState();
    switch (state.cullingMode)
    {
    case CullingMode::CULL_NONE: return TriangleSides::BOTH;
    case CullingMode::CULL_FRONT_AND_BACK: return TriangleSides::NONE;
    default: break;
    }
    const bool drawsFront = state.cullingMode == CullingMode::CULL_BACK;
    const bool isClockwise = (state.windingOrder == WindingOrder::WINDING_CW) != isMirrored;
    return drawsFront != (isClockwise != isTurned) ? TriangleSides::FRONT : TriangleSides::BACK;
}

/// Whether a transform flattens so much that its inverse would be mostly rounding errors.
bool isFlattening(const Matrix4f& transform)
{
    constexpr float LEAST = 1e-4f;
    const Vector3f x = normalize(transform.columns[0].xyz());
    const Vector3f y = normalize(transform.columns[1].xyz());
    const Vector3f z = normalize(transform.columns[2].xyz());
    return !(std::fabs(dot(x, cross(y, z))) > LEAST);
}

bool isSwitchedOff(const Mesh& mesh)
{
    return mesh.getIndexBuffer() && !mesh.getIndexBuffer()->isEnabled();
}

class Picker : public SceneNodeVisitor
{
public:
    /// @param ray  with a direction of length 1.
    explicit Picker(const Ray& ray) : m_ray(ray) {}

    using SceneNodeVisitor::visit;
    void visit(Solid* solid) override
    {
        MeshHit hit;
        hit.distance = std::numeric_limits<float>::max();
        const MeshGeometry* const geometry =
            solid->getMesh() ? solid->getMesh()->getGeometry().get() : nullptr;
        if (!geometry || !solid->getAppearance() || isSwitchedOff(*solid->getMesh()) ||
            !meetSolid(*solid, *geometry, hit))
            return;
        hits.push_back({SharedPtr<Solid>(solid), hit.triangle,
                        m_ray.position + m_ray.direction * hit.distance, hit.distance});
    }

    std::vector<PickHit> hits;

private:
    /// A mesh without joints is tested in its own space, where it has a tree of triangles.
    bool meetSolid(const Solid& solid, const MeshGeometry& geometry, MeshHit& hit)
    {
        const Appearance& appearance = *solid.getAppearance();
        const bool isMirrored = solid.turnsWinding(appearance.getShaderProgram().get());
        const Matrix4f& world = solid.getWorldTransform();
        if (!isMovedByJoints(solid) && !isFlattening(world))
            return meet(geometry, transform(m_ray, inverse(world)),
                        getDrawnSides(appearance, isMirrored, isMirrored), hit);
        placeVertices(solid, m_places);
        return meet(geometry, m_ray, getDrawnSides(appearance, isMirrored, false), m_places, hit);
    }

    const Ray& m_ray;
    std::vector<Vector3f> m_places;
};

} // namespace

std::vector<PickHit> pick(SceneNode& scene, const Ray& ray, const FlagMask& flags)
{
    // Squares of very long or short directions overflow or underflow.
    const Vector3f& way = ray.direction;
    const float largest = std::max({std::fabs(way.x), std::fabs(way.y), std::fabs(way.z)});
    const Ray unit{ray.position, normalize(Vector3f(way.x / largest, way.y / largest, way.z / largest))};
    if (!(length(unit.direction) > 0.5f)) // no direction, or NaN
        return {};
    Picker picker(unit);
    visitScene(picker, scene, flags, flags);
    std::stable_sort(picker.hits.begin(), picker.hits.end(),
                     [](const PickHit& a, const PickHit& b) { return a.distance < b.distance; });
    return picker.hits;
}

} // namespace orv
