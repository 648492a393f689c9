#include "glogeometry.h"

#include "glolog.h"

#include "orv/assetcachepool.h"
#include "orv/indexbuffercache.h"
#include "orv/meshcache.h"
#include "orv/vertexbuffercache.h"

#include <algorithm>
#include <cmath>
#include <cstring>
#include <iterator>

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

constexpr Format getFormat(uint32_t type)
{
    return Format(type < type::COUNT ? type::ATTRIB_FORMATS[type] : type::UNKNOWN_ATTRIB_FORMAT);
}

/// As the GL reads it, which is four bytes for the two fixed point codes.
constexpr uint32_t getComponentSize(Format format)
{
    constexpr uint32_t SIZES[] = {1, 1, 2, 2, 4, 4};
    return SIZES[size_t(format)];
}

/// A stride of 0 means that nothing lies between the vertices.
uint32_t getStride(const VertexAttribute& attribute)
{
    const uint32_t size = uint32_t(attribute.componentCount) * getComponentSize(getFormat(attribute.type));
    return attribute.stride > 0 ? uint32_t(attribute.stride) : size;
}

/// Whether every vertex's value lies in the data; then all reads below and in the GL are in bounds.
bool isInside(const VertexAttribute& attribute, const VertexSet& vertices)
{
    if (attribute.componentCount < 1 || attribute.componentCount > 4 || attribute.offset < 0 ||
        attribute.stride < 0)
        return false;
    if (vertices.vertexCount == 0)
        return true;
    const uint64_t size = uint64_t(attribute.componentCount) * getComponentSize(getFormat(attribute.type));
    const uint64_t lastVertex = uint64_t(vertices.vertexCount - 1) * getStride(attribute);
    return uint64_t(attribute.offset) + lastVertex + size <= vertices.data.bytes.size();
}

/// Joint numbers are numbers, whatever the file says.
bool isNormalised(const VertexAttribute& attribute, FileVersion version)
{
    return attribute.name != "a_joints" && (!hasNormalizeFlag(version) || attribute.normalize != 0);
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

const VertexAttribute* findAttribute(const Geometry& geometry, const char* name)
{
    for (const VertexAttribute& attribute : geometry.vertices.attributes)
    {
        if (attribute.name == name)
            return &attribute;
    }
    return nullptr;
}

/// The value that a shader would see.
float readComponent(const uint8_t* bytes, Format format, bool normalised)
{
    uint32_t word = 0;
    for (uint32_t i = 0; i < getComponentSize(format); ++i)
        word |= uint32_t(bytes[i]) << (8 * i);
    switch (format)
    {
    case Format::BYTE: return float(int8_t(word)) / (normalised ? 127.0f : 1.0f);
    case Format::UNSIGNED_BYTE: return float(word) / (normalised ? 255.0f : 1.0f);
    case Format::SHORT: return float(int16_t(word)) / (normalised ? 32767.0f : 1.0f);
    case Format::UNSIGNED_SHORT: return float(word) / (normalised ? 65535.0f : 1.0f);
    case Format::FIXED: return float(int32_t(word)) / 65536.0f;
    case Format::FLOAT: break;
    }
    float value;
    std::memcpy(&value, &word, sizeof(value));
    return value;
}

/// Calls use(vertex, value) with the first components of an attribute, at most so many of each vertex.
template <class Use>
void forEachComponent(const VertexAttribute& attribute, const VertexSet& vertices, bool normalised,
                      int32_t most, Use&& use)
{
    const Format format = getFormat(attribute.type);
    for (uint32_t vertex = 0; vertex < vertices.vertexCount; ++vertex)
    {
        const size_t start = size_t(attribute.offset) + size_t(vertex) * getStride(attribute);
        const uint8_t* bytes = vertices.data.bytes.data() + start;
        for (uint32_t i = 0; i < uint32_t(std::min(attribute.componentCount, most)); ++i)
            use(vertex, readComponent(bytes + i * getComponentSize(format), format, normalised));
    }
}

/// Squared distances of the vertices from the origin; none without positions.
std::vector<float> getSquaredDistances(const Geometry& geometry, FileVersion version)
{
    std::vector<float> distances;
    const VertexAttribute* position = findAttribute(geometry, "a_position");
    if (!position)
        return distances;
    distances.resize(geometry.vertices.vertexCount);
    forEachComponent(*position, geometry.vertices, isNormalised(*position, version), 3,
                     [&distances](uint32_t vertex, float value) { distances[vertex] += value * value; });
    return distances;
}

/// One more than the highest joint number; one that is no number of a joint counts as too high.
int countJoints(const Geometry& geometry)
{
    constexpr float LIMIT = 65535.0f;
    const VertexAttribute* joints = findAttribute(geometry, "a_joints");
    int count = 0;
    if (joints)
        forEachComponent(
            *joints, geometry.vertices, false, 4,
            [&count](uint32_t, float value)
            { count = std::max(count, value >= 0.0f && value < LIMIT ? int(value) + 1 : int(LIMIT)); });
    return count;
}

/// Of the vertices that the set draws.
float getRadius(const PrimitiveSet& set, const std::vector<float>& squaredDistances)
{
    if (squaredDistances.empty())
        return MeshHeader::INVALID_BOUNDING_RADIUS;
    float largest = 0.0f;
    if (set.indices)
    {
        for (const uint16_t index : set.indices->indices)
            largest = std::max(largest, squaredDistances[index]);
    }
    else
    {
        for (const float distance : squaredDistances)
            largest = std::max(largest, distance);
    }
    return std::sqrt(largest);
}

SharedPtr<IndexBuffer> makeIndexBuffer(IndexBufferCache& cache, const PrimitiveSet& set, uint32_t vertexCount)
{
    const Primitive primitive = getPrimitive(set.primitive);
    if (!set.indices)
        return create(cache, primitive, vertexCount, nullptr);
    const std::vector<uint16_t>& indices = set.indices->indices;
    const SharedPtr<IndexBuffer> buffer =
        cache.create(primitive, static_cast<unsigned int>(indices.size()), indices.data(), nullptr);
    if (buffer)
        buffer->commit();
    return buffer;
}

bool isInside(const PrimitiveSet& set, uint32_t vertexCount)
{
    if (!set.indices)
        return true;
    const std::vector<uint16_t>& indices = set.indices->indices;
    return std::all_of(indices.begin(), indices.end(), [=](uint16_t index) { return index < vertexCount; });
}

} // namespace

bool makeGeometry(AssetCachePool& pool, Geometry& geometry, FileVersion version, const char* fileName,
                  GloGeometry& made)
{
    VertexSet& vertices = geometry.vertices;
    std::vector<uint8_t>& bytes = vertices.data.bytes;
    std::vector<VertexBuffer::AttribDescription> descriptions;
    if (!describe(geometry, version, fileName, descriptions))
        return false;
    if (vertices.vertexCount > bytes.size())
    {
        ORV_GLO_ERROR("Geometry \"%s\" has no data for its %u vertices in %s", geometry.name.c_str(),
                      vertices.vertexCount, fileName);
        return false;
    }
    for (const PrimitiveSet& set : geometry.primitiveSets)
    {
        if (!isInside(set, vertices.vertexCount))
        {
            ORV_GLO_ERROR("Geometry \"%s\" has an index beyond its %u vertices in %s", geometry.name.c_str(),
                          vertices.vertexCount, fileName);
            return false;
        }
    }
    made.jointCount = countJoints(geometry);

    const SharedPtr<VertexBuffer> vertexBuffer = pool.getVertexBufferCache()->create(nullptr);
    const bool hasVertices = vertices.vertexCount > 0;
    if (!vertexBuffer ||
        (hasVertices &&
         !vertexBuffer->setAllAttributes(descriptions.data(), static_cast<unsigned int>(descriptions.size()),
                                         bytes.data(), static_cast<unsigned int>(bytes.size()))))
        return fail(geometry, fileName);

    const std::vector<float> squaredDistances = getSquaredDistances(geometry, version);
    bytes = {};
    for (const PrimitiveSet& set : geometry.primitiveSets)
    {
        MeshHeader header;
        header.boundingRadius = getRadius(set, squaredDistances);
        const SharedPtr<IndexBuffer> indexBuffer =
            makeIndexBuffer(*pool.getIndexBufferCache(), set, vertices.vertexCount);
        const SharedPtr<Mesh> mesh =
            indexBuffer ? pool.getMeshCache()->create(header, indexBuffer, vertexBuffer, nullptr)
                        : SharedPtr<Mesh>();
        if (!mesh)
            return fail(geometry, fileName);
        made.meshes.push_back(mesh);
    }
    return true;
}

} // namespace orv::detail
