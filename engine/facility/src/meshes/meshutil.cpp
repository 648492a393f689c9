#include "orv/meshutil.h"

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <utility>
#include <vector>

namespace orv
{

namespace
{

const float PI = 3.14159265358979f;

/// The vertices and indices of a shape while it is being made.
struct Shape
{
    Shape(unsigned int vertexCountWanted, unsigned int indexCountWanted)
        : vertexCount(vertexCountWanted)
        , indexCount(indexCountWanted)
        , positions(makeShared<VertexArray>(int(vertexCount), int(sizeof(float)), 3))
        , normals(makeShared<VertexArray>(int(vertexCount), int(sizeof(float)), 3))
        , uvs(makeShared<VertexArray>(int(vertexCount), int(sizeof(float)), 2))
        , indices(indexCount)
    {
    }

    bool isComplete() const
    {
        return positions && normals && uvs && positions->getSizeInBytes() > 0 &&
               normals->getSizeInBytes() > 0 && uvs->getSizeInBytes() > 0;
    }

    void addVertex(const Vector3f& position, const Vector3f& normal, const Vector2f& uv)
    {
        std::copy_n(position.data(), 3, positions->getData<float>() + vi);
        std::copy_n(normal.data(), 3, normals->getData<float>() + vi);
        std::copy_n(uv.data(), 2, uvs->getData<float>() + ti);
        vi += 3;
        ti += 2;
    }

    void addTriangle(unsigned int a, unsigned int b, unsigned int c)
    {
        for (const unsigned int index : {a, b, c})
            indices[ii++] = static_cast<unsigned short>(index);
    }

    void checkTotals() const
    {
        ORV_ASSERT(vi == vertexCount * 3);
        ORV_ASSERT(ti == vertexCount * 2);
        ORV_ASSERT(ii == indexCount);
    }

    unsigned int vertexCount;
    unsigned int indexCount;
    SharedPtr<VertexArray> positions;
    SharedPtr<VertexArray> normals;
    SharedPtr<VertexArray> uvs;
    std::vector<unsigned short> indices;
    unsigned int vi = 0; ///< Floats written to positions and to normals.
    unsigned int ti = 0; ///< Floats written to uvs.
    unsigned int ii = 0; ///< Indices written.
};

/// A quad from its lower left corner along right and up, which are whole edges; its front faces right x up.
void addQuad(Shape& shape, const Vector3f& corner, const Vector3f& right, const Vector3f& up,
             const Vector2f& uvScale)
{
    const Vector3f normal = normalize(cross(right, up));
    const unsigned int first = shape.vi / 3;
    shape.addVertex(corner, normal, Vector2f(0.0f, 0.0f));
    shape.addVertex(corner + right, normal, Vector2f(uvScale.x, 0.0f));
    shape.addVertex(corner + right + up, normal, uvScale);
    shape.addVertex(corner + up, normal, Vector2f(0.0f, uvScale.y));
    shape.addTriangle(first, first + 1, first + 3);
    shape.addTriangle(first + 1, first + 2, first + 3);
}

Mesh::Ptr createMesh(MeshCache& cache, const Shape& shape, float boundingRadius)
{
    shape.checkTotals();
    const Bounds bounds = computeBounds(shape.positions);
    const VertexBuffer::Ptr vertexBuffer = cache.getVertexBufferCache()->create(nullptr);
    if (!vertexBuffer)
        return {};
    const auto add = [&vertexBuffer](const SharedPtr<VertexArray>& array, const char* name)
    {
        vertexBuffer->addAttrib(array, name, VertexBuffer::AttribFormat::FLOAT,
                                VertexBuffer::AttribUsage::GL_BUFFER, false);
    };
    add(shape.positions, "a_position");
    add(shape.normals, "a_normal");
    add(shape.uvs, "a_uv0");
    vertexBuffer->commit();

    const IndexBuffer::Ptr indexBuffer = cache.getIndexBufferCache()->create(
        IndexBuffer::Primitive::TRIANGLES, shape.indexCount, shape.indices.data(), nullptr);
    if (!indexBuffer)
        return {};
    indexBuffer->commit();

    MeshHeader header;
    header.boundingRadius = boundingRadius;
    const Mesh::Ptr mesh = cache.create(header, indexBuffer, vertexBuffer, nullptr);
    if (mesh)
        mesh->setBounds(bounds);
    return mesh;
}

void addSphereVertices(Shape& shape, unsigned int segments, unsigned int wedges, const Vector2f& uvScale)
{
    for (unsigned int i = 0; i <= segments; ++i)
    {
        const float v = float(i) / float(segments);
        const float theta = v * PI;
        for (unsigned int j = 0; j <= wedges; ++j)
        {
            const float u = float(j) / float(wedges);
            const float phi = float(j % wedges) / float(wedges) * 2.0f * PI; // closes the seam to the bit
            const Vector3f normal(-std::sin(phi) * std::sin(theta), -std::cos(theta),
                                  std::sin(theta) * std::cos(phi));
            shape.addVertex(normal * 0.5f, normal, Vector2f(u * uvScale.x, v * uvScale.y));
        }
    }
}

void addSphereTriangles(Shape& shape, unsigned int segments, unsigned int wedges)
{
    const unsigned int vertexCount = shape.vertexCount;
    for (unsigned int i = 0; i < segments; ++i)
    {
        for (unsigned int j = 0; j < wedges; ++j)
        {
            const unsigned int bl = i * (wedges + 1) + j;
            const unsigned int tl = bl + wedges + 1;
            const unsigned int br = bl + 1;
            const unsigned int tr = tl + 1;
            ORV_ASSERT(bl < vertexCount * 3);
            ORV_ASSERT(tl < vertexCount * 3);
            ORV_ASSERT(br < vertexCount * 3);
            ORV_ASSERT(tr < vertexCount * 3);
            shape.addTriangle(tr, br, bl);
            shape.addTriangle(bl, tl, tr);
        }
    }
}

} // namespace

float computeMaximumLength(const SharedPtr<VertexArray>& array)
{
    const float* components = array ? std::as_const(*array).getData<float>() : nullptr;
    if (!components)
        return 0.0f;
    const int componentCount = array->getComponentCount();
    float maximum = 0.0f;
    for (int i = 0; i < array->getVertexCount(); ++i, components += componentCount)
    {
        float square = 0.0f;
        for (int k = 0; k < std::min(componentCount, 3); ++k)
            square += components[k] * components[k];
        maximum = std::max(maximum, square);
    }
    return std::sqrt(maximum);
}

Bounds computeBounds(const SharedPtr<VertexArray>& array)
{
    const float* components = array ? std::as_const(*array).getData<float>() : nullptr;
    if (!components)
        return {};
    std::vector<Vector3f> places(size_t(array->getVertexCount()));
    for (Vector3f& place : places)
    {
        std::copy_n(components, std::min(array->getComponentCount(), 3), place.data());
        components += array->getComponentCount();
    }
    return computeBounds(places.data(), places.size());
}

Mesh::Ptr createSphereMesh(MeshCache& cache, unsigned int segments, unsigned int wedges,
                           const Vector2f& uvScale)
{
    if (segments < 2)
        ORV_LOG_WARN("Enforced minimum of 2 sphere segments. (was %d)", int(segments));
    if (wedges < 2)
        ORV_LOG_WARN("Enforced minimun of 2 sphere wedges. (was %d)", int(wedges));
    segments = std::max(segments, 2u);
    wedges = std::max(wedges, 2u);

    const uint64_t limit = UINT16_MAX + 1;
    if (segments >= limit || wedges >= limit || uint64_t(segments + 1) * (wedges + 1) > limit)
    {
        ORV_LOG_ERROR("A sphere of %u segments and %u wedges has more than %u vertices", segments, wedges,
                      unsigned(limit));
        return {};
    }
    Shape shape((segments + 1) * (wedges + 1), segments * wedges * 6);
    if (!shape.isComplete())
        return {};
    addSphereVertices(shape, segments, wedges, uvScale);
    addSphereTriangles(shape, segments, wedges);
    return createMesh(cache, shape, 0.5f);
}

Mesh::Ptr createCubeMesh(MeshCache& cache, const Vector2f& uvScale)
{
    const Vector3f ups[6] = {Vector3f(0, 1, 0), Vector3f(0, 1, 0), Vector3f(0, 0, -1),
                             Vector3f(0, 0, 1), Vector3f(0, 1, 0), Vector3f(0, 1, 0)};
    const Vector3f normals[6] = {Vector3f(1, 0, 0),  Vector3f(-1, 0, 0), Vector3f(0, 1, 0),
                                 Vector3f(0, -1, 0), Vector3f(0, 0, 1),  Vector3f(0, 0, -1)};
    Shape shape(24, 36);
    if (!shape.isComplete())
        return {};
    for (int face = 0; face < 6; ++face)
    {
        const Vector3f right = cross(ups[face], normals[face]);
        addQuad(shape, normals[face] - right - ups[face], right * 2.0f, ups[face] * 2.0f, uvScale);
    }
    return createMesh(cache, shape, std::sqrt(3.0f));
}

Mesh::Ptr createSquareMesh(MeshCache& cache, const Vector2f& uvScale)
{
    Shape shape(4, 6);
    if (!shape.isComplete())
        return {};
    addQuad(shape, Vector3f(-0.5f, -0.5f, 0.0f), Vector3f(1, 0, 0), Vector3f(0, 1, 0), uvScale);
    return createMesh(cache, shape, std::sqrt(2.0f));
}

} // namespace orv
