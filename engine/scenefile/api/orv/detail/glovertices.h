#pragma once

#include "orv/detail/glorecords.h"
#include "orv/vertexbuffer.h"

#include <algorithm>
#include <cstring>

/// The layout of attributes in a scene file's vertex data, for the loader and the inspector.
namespace orv::detail::glo
{

using AttribFormat = VertexBuffer::AttribFormat;

constexpr AttribFormat getFormat(uint32_t type)
{
    return AttribFormat(type < type::COUNT ? type::ATTRIB_FORMATS[type] : type::UNKNOWN_ATTRIB_FORMAT);
}

/// As the GL reads it, which is four bytes for the two fixed point codes.
constexpr uint32_t getComponentSize(AttribFormat format)
{
    constexpr uint32_t SIZES[] = {1, 1, 2, 2, 4, 4};
    return SIZES[size_t(format)];
}

/// A stride of 0 means adjacent vertices.
inline uint32_t getStride(const VertexAttribute& attribute)
{
    const uint32_t size = uint32_t(attribute.componentCount) * getComponentSize(getFormat(attribute.type));
    return attribute.stride > 0 ? uint32_t(attribute.stride) : size;
}

/// Whether the values of all vertices are inside the data, so that all reads below and in GL are in bounds.
inline bool isInside(const VertexAttribute& attribute, const VertexSet& vertices)
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

/// Joint indices are never normalised, whatever the file says.
inline bool isNormalised(const VertexAttribute& attribute, FileVersion version)
{
    return attribute.name != "a_joints" && (!hasNormalizeFlag(version) || attribute.normalize != 0);
}

inline const VertexAttribute* findAttribute(const Geometry& geometry, const char* name)
{
    for (const VertexAttribute& attribute : geometry.vertices.attributes)
    {
        if (attribute.name == name)
            return &attribute;
    }
    return nullptr;
}

/// The value that a shader would see.
inline float readComponent(const uint8_t* bytes, AttribFormat format, bool normalised)
{
    uint32_t word = 0;
    for (uint32_t i = 0; i < getComponentSize(format); ++i)
        word |= uint32_t(bytes[i]) << (8 * i);
    switch (format)
    {
    case AttribFormat::BYTE: return float(int8_t(word)) / (normalised ? 127.0f : 1.0f);
    case AttribFormat::UNSIGNED_BYTE: return float(word) / (normalised ? 255.0f : 1.0f);
    case AttribFormat::SHORT: return float(int16_t(word)) / (normalised ? 32767.0f : 1.0f);
    case AttribFormat::UNSIGNED_SHORT: return float(word) / (normalised ? 65535.0f : 1.0f);
    case AttribFormat::FIXED: return float(int32_t(word)) / 65536.0f;
    case AttribFormat::FLOAT: break;
    }
    float value;
    std::memcpy(&value, &word, sizeof(value));
    return value;
}

/// Calls use(vertex, value) with the first components of an attribute, at most COUNT of each vertex.
template <class Use>
void forEachComponent(const VertexAttribute& attribute, const VertexSet& vertices, bool normalised,
                      int32_t most, Use&& use)
{
    const AttribFormat format = getFormat(attribute.type);
    for (uint32_t vertex = 0; vertex < vertices.vertexCount; ++vertex)
    {
        const size_t start = size_t(attribute.offset) + size_t(vertex) * getStride(attribute);
        const uint8_t* bytes = vertices.data.bytes.data() + start;
        for (uint32_t i = 0; i < uint32_t(std::min(attribute.componentCount, most)); ++i)
            use(vertex, readComponent(bytes + i * getComponentSize(format), format, normalised));
    }
}

/// One more than the highest joint index; an invalid index counts as too high.
inline int countJoints(const Geometry& geometry)
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

} // namespace orv::detail::glo
