#include "orv/mesh.h"

namespace orv
{

Mesh::Mesh(const MeshHeader& header, const IndexBuffer::Ptr& indexBuffer,
           const VertexBuffer::Ptr& vertexBuffer)
    : m_header(header)
    , m_indexBuffer(indexBuffer)
    , m_vertexBuffer(vertexBuffer)
{
}

Mesh::~Mesh() = default;

} // namespace orv
