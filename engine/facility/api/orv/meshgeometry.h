#pragma once

#include "orv/bounds.h"
#include "orv/indexbuffer.h"
#include "orv/ray.h"
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
        uint8_t joints[4] = {0, 0, 0, 0};
        float weights[4] = {1.0f, 0.0f, 0.0f, 0.0f};
    };

    std::vector<Vector3f> places;      ///< in the mesh's own space
    std::vector<Influence> influences; ///< as many as places, or none for meshes without joints
};

/// The shares that the built-in programs compute from weights: they add up to 1. Where the weights add up to
/// 0 or less, the first joint has all of it. Joint numbers beyond 255 become 255.
/// @param joints  numbers; the nearest whole ones count.
MeshVertices::Influence makeInfluence(const Vector4f& joints, const Vector4f& weights);

/// Which sides of triangles count: their fronts are those from which their corners go round counter-clockwise.
enum class TriangleSides
{
    NONE,
    FRONT,
    BACK,
    BOTH
};

/// What a mesh draws, in memory: for exact bounds, and for rays that look for triangles.
///
/// Threads: none; the first look for a triangle sorts them, which takes some tenths of a second for 100,000.
class ORV_API MeshGeometry : public Shared
{
public:
    ORV_CLASS_NAME("MeshGeometry")
    using Ptr = SharedPtr<MeshGeometry>;

    /// A triangle that a ray meets.
    struct Hit
    {
        float distance = 0.0f; ///< times the ray's direction
        uint32_t triangle = 0; ///< counted from 0 in the order of drawing
    };

    /// @param vertices  shared, and not to change any longer; must not be empty.
    /// @param indices   copied; null for all vertices in their order. Those beyond the vertices are left out, with the
    ///                  triangles that have them.
    MeshGeometry(const MeshVertices::Ptr& vertices, IndexBuffer::Primitive primitive,
                 const unsigned short* indices, std::size_t count);
    ~MeshGeometry() override;

    const MeshVertices& getVertices() const { return *m_vertices.get(); }
    /// Which of the vertices are drawn.
    const std::vector<bool>& getDrawn() const { return m_drawn; }
    /// Three vertices for each, wound as they are drawn; none of points and lines.
    const std::vector<uint32_t>& getTriangles() const { return m_triangles; }

    Bounds findBounds() const;
    /// By the joints' numbers, as Mesh::getJointBounds() has them.
    std::vector<Bounds> findJointBounds() const;

    /// Finds the nearest triangle that a ray meets, of equally near ones the first.
    /// @param ray  in the mesh's own space, with a direction of any length.
    /// @param hit  in: what is farther, or as far, does not count; out: the triangle.
    /// @return false, with hit unchanged, if there is none.
    bool meet(const Ray& ray, TriangleSides sides, Hit& hit) const;

    /// The same with the vertices at other places, as joints may hold them, and triangle by triangle.
    bool meet(const Ray& ray, TriangleSides sides, const std::vector<Vector3f>& places, Hit& hit) const;

private:
    /// A box around triangles: its two halves follow it, or it has a few in m_order.
    struct Node
    {
        Box box;
        uint32_t first; ///< in m_order, or else the second half
        uint32_t count; ///< 0 with halves
    };

    ORV_LOCAL void addTriangles(IndexBuffer::Primitive primitive, const std::vector<uint32_t>& order);
    ORV_LOCAL void sort() const;
    ORV_LOCAL void split(uint32_t first, uint32_t count, const std::vector<Vector3f>& centres) const;
    ORV_LOCAL Box findBox(uint32_t triangle) const;

    MeshVertices::Ptr m_vertices;
    std::vector<bool> m_drawn;
    std::vector<uint32_t> m_triangles;
    mutable std::vector<uint32_t> m_order; ///< of triangles
    mutable std::vector<Node> m_nodes;
};

/// Sets the bounds of a mesh, and of its joints, to those of a geometry.
ORV_API void setBounds(Mesh& mesh, const MeshGeometry& geometry);

} // namespace orv
