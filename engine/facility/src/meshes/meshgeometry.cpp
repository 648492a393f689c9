#include "orv/meshgeometry.h"

#include "orv/mesh.h"

#include <algorithm>
#include <utility>
#include <vector>

namespace orv
{

namespace
{

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

MeshGeometry::MeshGeometry(const MeshVertices::Ptr& vertices, IndexBuffer::Primitive primitive,
                           const unsigned short* indices, std::size_t count)
    : m_vertices(vertices)
    , m_drawn(vertices->places.size())
{
    std::vector<uint32_t> order(indices, indices ? indices + count : indices);
    for (uint32_t i = 0; !indices && i < m_drawn.size(); ++i)
        order.push_back(i);
    for (const uint32_t vertex : order)
    {
        if (vertex < m_drawn.size())
            m_drawn[vertex] = true;
    }
    addTriangles(primitive, order);
}

MeshGeometry::~MeshGeometry() = default;

void MeshGeometry::addTriangles(IndexBuffer::Primitive primitive, const std::vector<uint32_t>& order)
{
    const bool isFan = primitive == IndexBuffer::Primitive::TRIANGLE_FAN;
    const bool isStrip = primitive == IndexBuffer::Primitive::TRIANGLE_STRIP;
    if (!isFan && !isStrip && primitive != IndexBuffer::Primitive::TRIANGLES)
        return;
    for (std::size_t i = 2; i < order.size(); i += isFan || isStrip ? 1 : 3)
    {
        uint32_t corners[3] = {order[isFan ? 0 : i - 2], order[i - 1], order[i]};
        if (isStrip && i % 2 != 0) // every other triangle of a strip is wound the other way
            std::swap(corners[0], corners[1]);
        const auto isThere = [this](uint32_t vertex) { return vertex < m_drawn.size(); };
        if (std::all_of(corners, corners + 3, isThere))
            m_triangles.insert(m_triangles.end(), corners, corners + 3);
    }
}

Bounds MeshGeometry::findBounds() const
{
    std::vector<Vector3f> places;
    for (std::size_t i = 0; i < m_drawn.size(); ++i)
    {
        if (m_drawn[i])
            places.push_back(m_vertices->places[i]);
    }
    return computeBounds(places.data(), places.size());
}

std::vector<Bounds> MeshGeometry::findJointBounds() const
{
    if (m_vertices->influences.empty())
        return {};
    std::vector<Box> boxes;
    const auto addPlace = [&boxes](uint8_t joint, const Vector3f& place)
    {
        if (boxes.size() <= joint)
            boxes.resize(std::size_t(joint) + 1);
        boxes[joint].add(place);
    };
    if (!forEachShare(*m_vertices.get(), m_drawn, addPlace))
        return {};
    std::vector<Bounds> bounds;
    for (const Box& box : boxes)
        bounds.push_back(Bounds(box, box.isEmpty() ? -1.0f : 0.0f));
    const auto growRadius = [&bounds](uint8_t joint, const Vector3f& place)
    { bounds[joint].radius = std::max(bounds[joint].radius, length(place - bounds[joint].box.getCentre())); };
    forEachShare(*m_vertices.get(), m_drawn, growRadius);
    return bounds;
}

void setBounds(Mesh& mesh, const MeshGeometry& geometry)
{
    mesh.setBounds(geometry.findBounds());
    mesh.setJointBounds(geometry.findJointBounds());
}

} // namespace orv
