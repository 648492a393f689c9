#pragma once

#include "orv/export.h"
#include "orv/sharedptr.h"

#include <cstddef>
#include <memory>

namespace orv
{

/// The values of one vertex attribute in memory: vertex after vertex, each of componentCount components of
/// typeSize bytes, without gaps.
class ORV_API VertexArray : public Shared
{
public:
    ORV_CLASS_NAME("VertexArray")
    using Ptr = SharedPtr<VertexArray>;

    /// Zero-filled. Without memory for it, or where a size is negative or the whole is beyond 2 GiB, an error is
    /// logged and the array has no vertices.
    VertexArray(int vertexCount, int typeSize, int componentCount);
    ~VertexArray() override;

    int getVertexCount() const { return m_vertexCount; }       ///< How many vertices it has room for.
    int getTypeSize() const { return m_typeSize; }             ///< Bytes of one component.
    int getComponentCount() const { return m_componentCount; } ///< Per vertex.
    int getVertexSize() const { return m_typeSize * m_componentCount; } ///< Bytes.
    unsigned int getSizeInBytes() const { return m_sizeInBytes; }

    unsigned char* getBytes() { return m_bytes.get(); } ///< All of it.
    const unsigned char* getBytes() const { return m_bytes.get(); }

    /// The components as a T. @return null, after logging an assertion, if a T has another size than they.
    template <class T>
    T* getData()
    {
        return checkTypeSize(sizeof(T)) ? reinterpret_cast<T*>(m_bytes.get()) : nullptr;
    }
    /// The same, for reading.
    template <class T>
    const T* getData() const
    {
        return checkTypeSize(sizeof(T)) ? reinterpret_cast<const T*>(m_bytes.get()) : nullptr;
    }

private:
    bool checkTypeSize(std::size_t size) const;

    int m_vertexCount;
    int m_typeSize;
    int m_componentCount;
    unsigned int m_sizeInBytes;
    std::unique_ptr<unsigned char[]> m_bytes;
};

} // namespace orv
