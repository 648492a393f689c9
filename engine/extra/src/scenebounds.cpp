#include "orv/scenebounds.h"

#include "solidcorners.h"

#include "orv/appearance.h"
#include "orv/mesh.h"
#include "orv/meshgeometry.h"
#include "orv/scenenodevisitor.h"
#include "orv/sceneutil.h"
#include "orv/shaderprogram.h"
#include "orv/solid.h"

#include <algorithm>
#include <cmath>

namespace orv
{

namespace
{

Vector3f place(const Matrix4f& transform, const Vector3f& at)
{
    return (transform * Vector4f(at, 1.0f)).xyz();
}

/// Adds the corners of a box to places.
void addCorners(const Box& box, const Matrix4f& transform, std::vector<Vector3f>& places)
{
    for (int i = 0; i < 8; ++i)
        places.push_back(place(transform, Vector3f(i & 1 ? box.highest.x : box.lowest.x,
                                                   i & 2 ? box.highest.y : box.lowest.y,
                                                   i & 4 ? box.highest.z : box.lowest.z)));
}

std::vector<Matrix4f> getJointTransforms(const Solid& solid)
{
    std::vector<Matrix4f> transforms;
    for (int i = 0; i < std::min(solid.getJointCount(), Solid::MAX_JOINTS); ++i)
        transforms.push_back(solid.getJointTransform(i));
    return transforms;
}

/// The last joint replaces missing ones.
const Matrix4f& getJoint(const std::vector<Matrix4f>& joints, size_t number)
{
    return joints[std::min(number, joints.size() - 1)];
}

} // namespace

namespace detail
{

void addBoundsCorners(const Solid& solid, std::vector<Vector3f>& corners)
{
    if (!solid.getMesh())
        return;
    const Mesh& mesh = *solid.getMesh();
    if (!isMovedByJoints(solid))
    {
        if (mesh.getBounds().isKnown())
            addCorners(mesh.getBounds().box, solid.getWorldTransform(), corners);
        return;
    }
    const int last = std::min(solid.getJointCount(), Solid::MAX_JOINTS) - 1; // replaces missing ones
    for (size_t i = 0; i < mesh.getJointBounds().size(); ++i)
    {
        if (mesh.getJointBounds()[i].isKnown())
            addCorners(mesh.getJointBounds()[i].box, solid.getJointTransform(std::min(int(i), last)),
                       corners);
    }
}

} // namespace detail

namespace
{

/// Replaces places by world positions around all that a solid draws; none if unknown.
void findPlaces(const Solid& solid, std::vector<Vector3f>& places)
{
    const Mesh* const mesh = solid.getMesh().get();
    if (!placeVertices(solid, places))
        detail::addBoundsCorners(solid, places);
    const MeshGeometry* const geometry = mesh ? mesh->getGeometry().get() : nullptr;
    size_t kept = 0;
    for (size_t i = 0; i < places.size(); ++i)
    {
        const bool isDrawn = !geometry || geometry->getDrawn()[i];
        if (isDrawn && std::isfinite(places[i].x + places[i].y + places[i].z)) // as computeBounds() has it
            places[kept++] = places[i];
    }
    places.resize(kept);
}

/// Visits a scene twice: for the box, then for the sphere around its centre.
class BoundsVisitor : public SceneNodeVisitor
{
public:
    using SceneNodeVisitor::visit;
    void visit(Solid* solid) override
    {
        findPlaces(*solid, m_places);
        if (m_places.empty() && solid->getMesh())
            ++unknown;
        const Vector3f centre = bounds.box.getCentre();
        for (const Vector3f& at : m_places)
        {
            if (isMeasuring)
                bounds.radius = std::max(bounds.radius, length(at - centre));
            else
                bounds.box.add(at);
        }
    }

    Bounds bounds;
    bool isMeasuring = false; ///< the sphere
    int unknown = 0;

private:
    std::vector<Vector3f> m_places;
};

} // namespace

bool isMovedByJoints(const Solid& solid)
{
    const Appearance* const appearance = solid.getAppearance().get();
    const ShaderProgram* const program = appearance ? appearance->getShaderProgram().get() : nullptr;
    return solid.getJointCount() > 0 && program && program->usesJoints();
}

Bounds getOwnBounds(const Solid& solid)
{
    if (!isMovedByJoints(solid))
        return solid.getMesh() ? solid.getMesh()->getBounds() : Bounds();
    std::vector<Vector3f> places;
    findPlaces(solid, places);
    const Matrix4f toOwn = inverse(solid.getWorldTransform());
    for (Vector3f& at : places)
        at = place(toOwn, at);
    return computeBounds(places.data(), places.size());
}

bool placeVertices(const Solid& solid, std::vector<Vector3f>& places)
{
    places.clear();
    const MeshGeometry* const geometry = solid.getMesh() ? solid.getMesh()->getGeometry().get() : nullptr;
    if (!geometry)
        return false;
    const MeshVertices& vertices = geometry->getVertices();
    places.resize(vertices.places.size());
    const bool isMoved = isMovedByJoints(solid);
    const bool isSkinned = isMoved && !vertices.influences.empty();
    const std::vector<Matrix4f> joints =
        isMoved ? getJointTransforms(solid) : std::vector<Matrix4f>{solid.getWorldTransform()};
    const Matrix4f& whole =
        getJoint(joints, 1); // joints that a mesh does not name are all 1, as every missing attribute
    for (size_t i = 0; i < places.size(); ++i)
    {
        if (!isSkinned)
            places[i] = place(whole, vertices.places[i]);
        for (int j = 0; isSkinned && j < 4; ++j)
        {
            const MeshVertices::Influence& influence = vertices.influences[i];
            if (influence.weights[j] != 0.0f)
                places[i] +=
                    place(getJoint(joints, influence.joints[j]), vertices.places[i]) * influence.weights[j];
        }
    }
    return true;
}

Bounds getWorldBounds(SceneNode& top, int* unknown)
{
    BoundsVisitor visitor;
    visitScene(visitor, top);
    if (unknown)
        *unknown = visitor.unknown;
    visitor.isMeasuring = true;
    if (!visitor.bounds.box.isEmpty())
        visitScene(visitor, top);
    return visitor.bounds;
}

} // namespace orv
