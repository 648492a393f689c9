#pragma once

#include "orv/bounds.h"
#include "orv/detail/triangletree.h"
#include "orv/indexbuffer.h"
#include "orv/shared.h"
#include "orv/sharedptr.h"
#include "orv/vector.h"

#include <cstddef>
#include <cstdint>
#include <vector>

namespace orv
{

class Mesh;

/// The vertices of meshes in memory, for those who ask where they are: GL does not give them back.
class ORV_API MeshVertices : public Shared
{
public:
    ORV_CLASS_NAME("MeshVertices")
    using Ptr = SharedPtr<MeshVertices>;

    /// What moves a vertex: up to four joints, by their numbers, and their shares, which add up to 1.
    struct Influence
    {
        uint8_t joints[4] = {0, 0, 0, 0};            ///< The joints that move the vertex, by number.
        float weights[4] = {1.0f, 0.0f, 0.0f, 0.0f}; ///< The share of each.
    };

    std::vector<Vector3f> places;      ///< in the mesh's own space
    std::vector<Influence> influences; ///< as many as places, or none for meshes without joints
};

/// The shares that the built-in programs compute from weights: they add up to 1. Where the weights add up to
/// 0 or less, the first joint has all of it. Joint numbers beyond 255 become 255.
/// @param joints  numbers; the nearest whole ones count.
ORV_API MeshVertices::Influence makeInfluence(const Vector4f& joints, const Vector4f& weights);

/// What a mesh draws, in memory: for exact bounds, and for rays that look for triangles (see meet()).
class ORV_API MeshGeometry : public Shared
{
public:
    ORV_CLASS_NAME("MeshGeometry")
    using Ptr = SharedPtr<MeshGeometry>;

    /// @param vertices  shared, and not to change any longer; must not be empty.
    /// @param indices   copied; null for all vertices in their order. Those beyond the vertices are left out, with the
    ///                  triangles that have them.
    MeshGeometry(const MeshVertices::Ptr& vertices, IndexBuffer::Primitive primitive,
                 const unsigned short* indices, std::size_t count);
    ~MeshGeometry() override;

    /// The vertices, which other geometries may share.
    const MeshVertices& getVertices() const { return *m_vertices.get(); }
    /// Which of the vertices are drawn.
    const std::vector<bool>& getDrawn() const { return m_drawn; }
    /// Three vertices for each, wound as they are drawn; none of points and lines.
    const std::vector<uint32_t>& getTriangles() const { return m_triangles; }

    Bounds findBounds() const; ///< How far the triangles reach.
    /// By the joints' numbers, as Mesh::getJointBounds() has them.
    std::vector<Bounds> findJointBounds() const;

    /// For meet(), which fills it when it looks for the first time.
    detail::TriangleTree& getTree() const { return m_tree; }

private:
    ORV_LOCAL void addTriangles(IndexBuffer::Primitive primitive, const std::vector<uint32_t>& order);

    MeshVertices::Ptr m_vertices;
    std::vector<bool> m_drawn;
    std::vector<uint32_t> m_triangles;
    mutable detail::TriangleTree m_tree;
};

/// Sets the bounds of a mesh, and of its joints, to those of a geometry.
ORV_API void setBounds(Mesh& mesh, const MeshGeometry& geometry);

} // namespace orv
