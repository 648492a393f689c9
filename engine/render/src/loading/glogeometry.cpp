#include "glogeometry.h"

#include "orv/assetcachepool.h"
#include "orv/detail/glolog.h"
#include "orv/detail/glovertices.h"
#include "orv/indexbuffercache.h"
#include "orv/meshcache.h"
#include "orv/meshgeometry.h"
#include "orv/vertexbuffercache.h"

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <cstring>
#include <iterator>
#include <utility>

namespace orv::detail
{

using namespace glo;

namespace
{

using Format = VertexBuffer::AttribFormat;
using Primitive = IndexBuffer::Primitive;

/// By primitive code.
constexpr Primitive PRIMITIVES[] = {Primitive::POINTS,        Primitive::LINE_STRIP,   Primitive::LINE_LOOP,
                                    Primitive::LINES,         Primitive::TRIANGLE_FAN, Primitive::TRIANGLES,
                                    Primitive::TRIANGLE_STRIP};

constexpr Primitive getPrimitive(uint32_t code)
{
    return code < std::size(PRIMITIVES) ? PRIMITIVES[code] : Primitive::TRIANGLE_FAN;
}

bool fail(const Geometry& geometry, const char* fileName)
{
    ORV_GLO_ERROR("Geometry \"%s\" cannot be made in %s", geometry.name.c_str(), fileName);
    return false;
}

bool describe(const Geometry& geometry, FileVersion version, const char* fileName,
              std::vector<VertexBuffer::AttribDescription>& descriptions)
{
    for (const VertexAttribute& attribute : geometry.vertices.attributes)
    {
        if (!isInside(attribute, geometry.vertices))
        {
            ORV_GLO_ERROR("Vertex attribute \"%s\" of geometry \"%s\" does not fit its vertex data in %s",
                          attribute.name.c_str(), geometry.name.c_str(), fileName);
            return false;
        }
        if (getFormat(attribute.type) == Format::FIXED)
            ORV_GLO_WARN("Vertex attribute \"%s\" of geometry \"%s\" is read as 16.16 fixed point in %s",
                         attribute.name.c_str(), geometry.name.c_str(), fileName);
        descriptions.push_back({attribute.name, getFormat(attribute.type), isNormalised(attribute, version),
                                attribute.offset, attribute.componentCount, attribute.stride});
    }
    return true;
}

/// The first four components of an attribute's values; those that it lacks are 0.
/// @return empty where the geometry has no such attribute.
std::vector<Vector4f> readAttribute(const Geometry& geometry, FileVersion version, const char* name)
{
    std::vector<Vector4f> values;
    const VertexAttribute* const attribute = findAttribute(geometry, name);
    if (!attribute)
        return values;
    values.resize(geometry.vertices.vertexCount);
    int component = 0;
    forEachComponent(*attribute, geometry.vertices, isNormalised(*attribute, version), 4,
                     [&](uint32_t vertex, float value)
                     {
                         values[vertex].data()[component] = value;
                         component = (component + 1) % attribute->componentCount;
                     });
    return values;
}

/// @return without positions if the geometry has none.
SharedPtr<MeshVertices> readVertices(const Geometry& geometry, FileVersion version)
{
    const SharedPtr<MeshVertices> vertices = makeShared<MeshVertices>();
    if (!vertices)
        return {};
    for (const Vector4f& place : readAttribute(geometry, version, "a_position"))
        vertices->places.push_back(place.xyz());
    const std::vector<Vector4f> joints = readAttribute(geometry, version, "a_joints");
    const std::vector<Vector4f> weights = readAttribute(geometry, version, "a_weights");
    const Vector4f missing(1.0f, 1.0f, 1.0f, 1.0f); // as GL has it
    for (size_t i = 0; i < joints.size() && i < vertices->places.size(); ++i)
        vertices->influences.push_back(makeInfluence(joints[i], weights.empty() ? missing : weights[i]));
    return vertices;
}

/// About the origin, of the vertices that are drawn.
float getRadius(const MeshGeometry& geometry)
{
    float largest = 0.0f;
    const std::vector<Vector3f>& places = geometry.getVertices().places;
    for (size_t i = 0; i < places.size(); ++i)
    {
        if (geometry.getDrawn()[i])
            largest = std::max(largest, dot(places[i], places[i]));
    }
    return std::sqrt(largest);
}

/// @param vertices  empty if no geometry is kept.
/// @return empty then.
SharedPtr<MeshGeometry> makeMeshGeometry(const PrimitiveSet& set, const SharedPtr<MeshVertices>& vertices)
{
    if (!vertices || vertices->places.empty())
        return {};
    if (!set.indices)
        return makeShared<MeshGeometry>(vertices, getPrimitive(set.primitive), nullptr, 0);
    const RawVector<uint16_t>& indices = set.indices->indices;
    return makeShared<MeshGeometry>(vertices, getPrimitive(set.primitive), indices.data(), indices.size());
}

SharedPtr<IndexBuffer> makeIndexBuffer(IndexBufferCache& cache, const PrimitiveSet& set, uint32_t vertexCount)
{
    const Primitive primitive = getPrimitive(set.primitive);
    if (!set.indices)
        return create(cache, primitive, vertexCount, nullptr);
    const RawVector<uint16_t>& indices = set.indices->indices;
    const SharedPtr<IndexBuffer> buffer =
        create(cache, primitive, static_cast<unsigned int>(indices.size()), nullptr);
    return buffer && buffer->commit(indices.data()) ? buffer : nullptr;
}

/// Eight at a time, in compiler vectors: this is the only work for each index of a large scene. The highest bit is
/// flipped, since some processors compare signed numbers only.
bool isBelow(const uint16_t* indices, size_t count, uint16_t limit)
{
    typedef int16_t Lanes __attribute__((vector_size(16)));
    constexpr size_t WIDTH = sizeof(Lanes) / sizeof(uint16_t);
    constexpr int16_t FLIP = INT16_MIN;
    const Lanes flip = {FLIP, FLIP, FLIP, FLIP, FLIP, FLIP, FLIP, FLIP};
    Lanes largest = flip;
    const uint16_t* next = indices;
    const auto takeSome = [&largest, &next, flip ]() __attribute__((always_inline))
    {
        Lanes some;
        std::memcpy(&some, next, sizeof some);
        some ^= flip;
        largest = some > largest ? some : largest;
        next += WIDTH;
    };
    const auto takeMore = [&takeSome]() __attribute__((always_inline))
    {
        takeSome(), takeSome(), takeSome(), takeSome();
    };
    size_t steps = count / (16 * WIDTH);
    if (steps > 0)
    {
        do
            takeMore(), takeMore(), takeMore(), takeMore();
        while (--steps > 0);
    }
    largest ^= flip;
    const auto isBelowLimit = [limit](uint16_t index) { return index < limit; };
    uint16_t lanes[WIDTH];
    std::memcpy(lanes, &largest, sizeof lanes);
    return std::all_of(lanes, lanes + WIDTH, isBelowLimit) &&
           std::all_of(next, indices + count, isBelowLimit);
}

bool isInside(const PrimitiveSet& set, uint32_t vertexCount)
{
    if (!set.indices)
        return true;
    const RawVector<uint16_t>& indices = set.indices->indices;
    return vertexCount > UINT16_MAX || isBelow(indices.data(), indices.size(), uint16_t(vertexCount));
}

/// Whether there are bytes for the vertices, and vertices for the indices; logs otherwise.
bool isSound(const Geometry& geometry, const char* fileName)
{
    const uint32_t vertexCount = geometry.vertices.vertexCount;
    if (vertexCount > geometry.vertices.data.bytes.size())
    {
        ORV_GLO_ERROR("Geometry \"%s\" has no data for its %u vertices in %s", geometry.name.c_str(),
                      vertexCount, fileName);
        return false;
    }
    for (const PrimitiveSet& set : geometry.primitiveSets)
    {
        if (!isInside(set, vertexCount))
        {
            ORV_GLO_ERROR("Geometry \"%s\" has an index beyond its %u vertices in %s", geometry.name.c_str(),
                          vertexCount, fileName);
            return false;
        }
    }
    return true;
}

/// @param vertices  empty if no geometry is kept.
SharedPtr<Mesh> makeMesh(AssetCachePool& pool, const PrimitiveSet& set,
                         const SharedPtr<VertexBuffer>& vertexBuffer, uint32_t vertexCount,
                         const SharedPtr<MeshVertices>& vertices, MeshData wanted)
{
    MeshHeader header;
    const SharedPtr<MeshGeometry> geometry = makeMeshGeometry(set, vertices);
    if (geometry)
        header.boundingRadius = getRadius(*geometry);
    const SharedPtr<IndexBuffer> indexBuffer = makeIndexBuffer(*pool.getIndexBufferCache(), set, vertexCount);
    const SharedPtr<Mesh> mesh = indexBuffer
                                     ? pool.getMeshCache()->create(header, indexBuffer, vertexBuffer, nullptr)
                                     : SharedPtr<Mesh>();
    if (mesh && geometry)
        setBounds(*mesh, *geometry);
    if (mesh && wanted == MeshData::GEOMETRY)
        mesh->setGeometry(geometry);
    return mesh;
}

} // namespace

GloGeometries::GloGeometries(AssetCachePool& pool, MeshData wanted, const char* fileName)
    : m_pool(pool)
    , m_wanted(wanted)
    , m_fileName(fileName)
{
}

bool GloGeometries::receive(Geometry& geometry, FileVersion version)
{
    GloGeometry made;
    if (!make(geometry, version, made))
        return false;
    m_geometries.emplace(std::move(geometry.name), std::move(made));
    return true;
}

const GloGeometry* GloGeometries::find(const std::string& name) const
{
    const auto found = m_geometries.find(name);
    return found != m_geometries.end() ? &found->second : nullptr;
}

bool GloGeometries::make(Geometry& geometry, FileVersion version, GloGeometry& made)
{
    VertexSet& vertices = geometry.vertices;
    RawVector<uint8_t>& bytes = vertices.data.bytes;
    std::vector<VertexBuffer::AttribDescription> descriptions;
    if (!describe(geometry, version, m_fileName, descriptions) || !isSound(geometry, m_fileName))
        return false;
    made.jointCount = countJoints(geometry);

    const SharedPtr<VertexBuffer> vertexBuffer = m_pool.getVertexBufferCache()->create(nullptr);
    const bool hasVertices = vertices.vertexCount > 0;
    if (!vertexBuffer ||
        (hasVertices &&
         !vertexBuffer->setAllAttributes(descriptions.data(), static_cast<unsigned int>(descriptions.size()),
                                         bytes.data(), static_cast<unsigned int>(bytes.size()))))
        return fail(geometry, m_fileName);

    const SharedPtr<MeshVertices> places =
        m_wanted != MeshData::NONE ? readVertices(geometry, version) : SharedPtr<MeshVertices>();
    bytes = {};
    for (const PrimitiveSet& set : geometry.primitiveSets)
    {
        const SharedPtr<Mesh> mesh =
            makeMesh(m_pool, set, vertexBuffer, vertices.vertexCount, places, m_wanted);
        if (!mesh)
            return fail(geometry, m_fileName);
        made.meshes.push_back(mesh);
    }
    return true;
}

} // namespace orv::detail
