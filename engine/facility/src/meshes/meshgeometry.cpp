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
    std::vector<Vector3f> places[256]; // by joint
    std::size_t jointCount = 0;
    for (std::size_t vertex = 0; vertex < m_vertices->influences.size(); ++vertex)
    {
        const MeshVertices::Influence& influence = m_vertices->influences[vertex];
        for (int i = 0; m_drawn[vertex] && i < 4; ++i)
        {
            if (!isShare(influence.weights[i]))
                return {};
            if (influence.weights[i] == 0.0f)
                continue;
            places[influence.joints[i]].push_back(m_vertices->places[vertex]);
            jointCount = std::max(jointCount, influence.joints[i] + std::size_t(1));
        }
    }
    std::vector<Bounds> bounds;
    for (std::size_t joint = 0; joint < jointCount; ++joint)
        bounds.push_back(computeBounds(places[joint].data(), places[joint].size()));
    return bounds;
}

void setBounds(Mesh& mesh, const MeshGeometry& geometry)
{
    mesh.setBounds(geometry.findBounds());
    mesh.setJointBounds(geometry.findJointBounds());
}

} // namespace orv
