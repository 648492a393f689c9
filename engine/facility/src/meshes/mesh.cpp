#include "orv/mesh.h"

#include "orv/detail/boundsrevision.h"
#include "orv/meshgeometry.h"

#include <cmath>
#include <limits>
#include <utility>

namespace orv
{

namespace
{

Bounds makeBounds(float radius)
{
    const Vector3f corner(radius, radius, radius);
    Box box;
    box.add(-corner);
    box.add(corner);
    return radius >= 0.0f ? Bounds(box, radius) : Bounds();
}

} // namespace

Mesh::Mesh(const MeshHeader& header, const IndexBuffer::Ptr& indexBuffer,
           const VertexBuffer::Ptr& vertexBuffer)
    : m_header(header)
    , m_indexBuffer(indexBuffer)
    , m_vertexBuffer(vertexBuffer)
{
    takeBounds(makeBounds(header.boundingRadius));
}

Mesh::~Mesh() = default;

Vector4f Mesh::makeSphere(const Bounds& bounds)
{
    constexpr float ROUNDING = 1.0001f; // also of chains of transforms
    if (!bounds.isKnown())
        return Vector4f(0.0f, 0.0f, 0.0f, -std::numeric_limits<float>::infinity());
    return Vector4f(bounds.box.getCentre(), -bounds.radius * ROUNDING);
}

void Mesh::takeBounds(const Bounds& bounds)
{
    m_bounds = bounds;
    // A point is larger than its place: part of it may be in the view where that is outside.
    const bool drawsPoints = m_indexBuffer && m_indexBuffer->getPrimitive() == IndexBuffer::Primitive::POINTS;
    m_sphere = makeSphere(drawsPoints ? Bounds() : bounds);
    const float offset = length(m_sphere.xyz());
    m_isAroundOrigin = offset <= -m_sphere.w;
    m_safeDistance =
        offset > 0.0f ? offset - m_sphere.w : m_sphere.w; // no sphere is outside whose centre is inside
}

void Mesh::setBounds(const Bounds& bounds)
{
    const Vector4f before = m_sphere;
    takeBounds(bounds);
    const bool isInside = length(m_sphere.xyz() - before.xyz()) - m_sphere.w <= -before.w;
    const bool isLearned = std::isinf(before.w);
    if (!isInside || isLearned)
        detail::boundsChanged();
}

void Mesh::setJointBounds(std::vector<Bounds> bounds)
{
    m_jointBounds = std::move(bounds);
}

void Mesh::setGeometry(const SharedPtr<MeshGeometry>& geometry)
{
    m_geometry = geometry;
}

} // namespace orv
