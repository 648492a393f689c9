#include "orv/vertexarray.h"

#include <cstdint>
#include <cstring>
#include <new>

namespace orv
{

namespace
{

/// @return bytes of the whole array, or -1 if a size is negative or the array is larger than an int can count.
int64_t computeSize(int vertexCount, int typeSize, int componentCount)
{
    if (vertexCount < 0 || typeSize < 0 || componentCount < 0)
        return -1;
    const int64_t vertexSize = int64_t(typeSize) * componentCount;
    if (vertexSize > INT32_MAX || vertexSize * vertexCount > INT32_MAX)
        return -1;
    return vertexSize * vertexCount;
}

} // namespace

VertexArray::VertexArray(int vertexCount, int typeSize, int componentCount)
    : m_vertexCount(vertexCount)
    , m_typeSize(typeSize)
    , m_componentCount(componentCount)
    , m_sizeInBytes(0)
{
    const int64_t size = computeSize(vertexCount, typeSize, componentCount);
    if (size >= 0)
        m_bytes.reset(new (std::nothrow) unsigned char[std::size_t(size)]);
    if (!m_bytes)
    {
        ORV_LOG_ERROR("Cannot make a vertex array of %d vertices with %d components of %d bytes", vertexCount,
                      componentCount, typeSize);
        m_vertexCount = m_typeSize = m_componentCount = 0;
        return;
    }
    m_sizeInBytes = unsigned(size);
    std::memset(m_bytes.get(), 0, m_sizeInBytes);
}

VertexArray::~VertexArray() = default;

bool VertexArray::checkTypeSize(std::size_t size) const
{
    if (size == std::size_t(m_typeSize))
        return true;
    ORV_LOG_ERROR("ORV_ASSERT: sizeof( T ) == m_typeSize");
    return false;
}

} // namespace orv
