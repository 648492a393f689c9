#pragma once

#include "orv/bounds.h"
#include "orv/detail/drawmark.h"
#include "orv/export.h"
#include "orv/indexbuffer.h"
#include "orv/matrix.h"
#include "orv/vector.h"
#include "orv/vertexbuffer.h"

#include <vector>

namespace orv
{

class MeshGeometry;

/// What is known of a mesh besides its buffers.
struct MeshHeader
{
    static constexpr float INVALID_BOUNDING_RADIUS = -1.0f; ///< Marks a radius that is not known.

    /// Of a sphere about the mesh's origin around all of its vertices, or INVALID_BOUNDING_RADIUS for unknown.
    float boundingRadius = INVALID_BOUNDING_RADIUS;

    Vector3f offset;                         ///< The application's own; the engine does not read it.
    Matrix4f transform = Matrix4f::IDENTITY; ///< Likewise.
};

/// Geometry to draw: vertices, what to make of them, and how far they reach.
class ORV_API Mesh : public Shared
{
public:
    ORV_CLASS_NAME("Mesh")
    using Ptr = SharedPtr<Mesh>;

    /// Shares the buffers.
    Mesh(const MeshHeader& header, const IndexBuffer::Ptr& indexBuffer,
         const VertexBuffer::Ptr& vertexBuffer);
    ~Mesh() override;

    const MeshHeader& getHeader() const { return m_header; } ///< What it was made of.
    const IndexBuffer::Ptr& getIndexBuffer() const { return m_indexBuffer; }
    const VertexBuffer::Ptr& getVertexBuffer() const { return m_vertexBuffer; }

    /// Around the vertices that are drawn, in the mesh's own space. Unknown for a mesh whose header has no bounding
    /// radius, until they are set.
    const Bounds& getBounds() const { return m_bounds; }

    /// For a mesh whose bounds are not known (see computeBounds()), or whose program moves vertices about: then around
    /// all places that they may reach. What is drawn with SimpleRenderer::setCulled() has to stay inside.
    void setBounds(const Bounds& bounds);

    /// For skinned meshes, indexed by joint number: boxes in the mesh's own space around the vertices that
    /// have a weight for the joint, unknown where there are none. Empty while nothing is known.
    const std::vector<Bounds>& getJointBounds() const { return m_jointBounds; }
    void setJointBounds(std::vector<Bounds> bounds);

    /// The triangles in memory, for exact bounds of what joints move and for pick(); empty unless they were asked for:
    /// MeshData::GEOMETRY keeps those of scene files.
    const SharedPtr<MeshGeometry>& getGeometry() const { return m_geometry; }
    /// @param geometry  shared; what the mesh draws, or empty to keep nothing.
    void setGeometry(const SharedPtr<MeshGeometry>& geometry);

    detail::DrawMark& getDrawMark() const { return m_drawMark; } ///< the renderer's

    /// Draw path: the centre of a sphere around the mesh and, in w, its radius below 0: minus infinity where the bounds
    /// are unknown.
    const Vector4f& getSphere() const { return m_sphere; }
    /// Draw path: whether the origin is inside of that sphere.
    bool isAroundOrigin() const { return m_isAroundOrigin; }
    /// Draw path: a mesh whose origin is inside of a plane by at least this distance is not outside of it.
    float getSafeDistance() const { return m_safeDistance; }
    ORV_LOCAL static Vector4f makeSphere(const Bounds& bounds);

private:
    ORV_LOCAL void takeBounds(const Bounds& bounds);

    MeshHeader m_header;
    IndexBuffer::Ptr m_indexBuffer;
    VertexBuffer::Ptr m_vertexBuffer;
    mutable detail::DrawMark m_drawMark;
    Vector4f m_sphere;
    bool m_isAroundOrigin = true;
    float m_safeDistance = 0.0f;
    Bounds m_bounds;
    std::vector<Bounds> m_jointBounds;
    SharedPtr<MeshGeometry> m_geometry;
};

} // namespace orv
