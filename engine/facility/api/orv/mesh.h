#pragma once

#include "orv/detail/drawmark.h"
#include "orv/export.h"
#include "orv/indexbuffer.h"
#include "orv/matrix.h"
#include "orv/vector.h"
#include "orv/vertexbuffer.h"

namespace orv
{

struct MeshHeader
{
    static constexpr float INVALID_BOUNDING_RADIUS = -1.0f;

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

    Mesh(const MeshHeader& header, const IndexBuffer::Ptr& indexBuffer,
         const VertexBuffer::Ptr& vertexBuffer);
    ~Mesh() override;

    const MeshHeader& getHeader() const { return m_header; }
    const IndexBuffer::Ptr& getIndexBuffer() const { return m_indexBuffer; }
    const VertexBuffer::Ptr& getVertexBuffer() const { return m_vertexBuffer; }

    detail::DrawMark& getDrawMark() const { return m_drawMark; } ///< the renderer's

private:
    MeshHeader m_header;
    IndexBuffer::Ptr m_indexBuffer;
    VertexBuffer::Ptr m_vertexBuffer;
    mutable detail::DrawMark m_drawMark;
};

} // namespace orv
