#include "orv/meshgeometry.h"

#include "orv/mesh.h"

#include <algorithm>
#include <vector>

namespace orv
{

namespace
{

/// Whether each vertex is drawn.
std::vector<bool> findDrawn(const MeshVertices& vertices, const unsigned short* indices, std::size_t count)
{
    std::vector<bool> drawn(vertices.places.size(), !indices);
    for (std::size_t i = 0; indices && i < count; ++i)
        drawn[indices[i]] = true;
    return drawn;
}

Bounds findBounds(const MeshVertices& vertices, const std::vector<bool>& drawn)
{
    std::vector<Vector3f> places;
    for (std::size_t i = 0; i < drawn.size(); ++i)
    {
        if (drawn[i])
            places.push_back(vertices.places[i]);
    }
    return computeBounds(places.data(), places.size());
}

bool isShare(float weight)
{
    return weight >= 0.0f && weight <= 1.0f;
}

/// Calls use(joint, place) for everything that a joint has a share in.
/// @return false if there are shares that are none.
template <class Use>
bool forEachShare(const MeshVertices& vertices, const std::vector<bool>& drawn, const Use& use)
{
    bool areShares = true;
    for (std::size_t vertex = 0; vertex < drawn.size(); ++vertex)
    {
        const MeshVertices::Influence& influence = vertices.influences[vertex];
        for (int i = 0; drawn[vertex] && i < 4; ++i)
        {
            areShares = areShares && isShare(influence.weights[i]);
            if (influence.weights[i] > 0.0f)
                use(influence.joints[i], vertices.places[vertex]);
        }
    }
    return areShares;
}

std::vector<Bounds> findJointBounds(const MeshVertices& vertices, const std::vector<bool>& drawn)
{
    std::vector<Box> boxes;
    const auto addPlace = [&boxes](uint8_t joint, const Vector3f& place)
    {
        if (boxes.size() <= joint)
            boxes.resize(std::size_t(joint) + 1);
        boxes[joint].add(place);
    };
    if (!forEachShare(vertices, drawn, addPlace))
        return {};
    std::vector<Bounds> bounds;
    for (const Box& box : boxes)
        bounds.push_back(Bounds(box, box.isEmpty() ? -1.0f : 0.0f));
    const auto growRadius = [&bounds](uint8_t joint, const Vector3f& place)
    { bounds[joint].radius = std::max(bounds[joint].radius, length(place - bounds[joint].box.getCentre())); };
    forEachShare(vertices, drawn, growRadius);
    return bounds;
}

} // namespace

MeshVertices::Influence makeInfluence(const Vector4f& joints, const Vector4f& weights)
{
    MeshVertices::Influence influence;
    const float total = weights.x + weights.y + weights.z + weights.w;
    for (int i = 0; i < 4; ++i)
    {
        const float number = joints[i] > 0.0f ? std::min(joints[i], 255.0f) : 0.0f;
        influence.joints[i] = uint8_t(number + 0.5f);
        if (total > 0.0f)
            influence.weights[i] = weights[i] / total;
    }
    return influence;
}

void setBounds(Mesh& mesh, const MeshVertices& vertices, const unsigned short* indices, std::size_t count)
{
    const std::vector<bool> drawn = findDrawn(vertices, indices, count);
    mesh.setBounds(findBounds(vertices, drawn));
    if (!vertices.influences.empty())
        mesh.setJointBounds(findJointBounds(vertices, drawn));
}

} // namespace orv
