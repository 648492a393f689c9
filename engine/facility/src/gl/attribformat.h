#pragma once

#include "countedgl.h"

#include "orv/vertexbuffer.h"

#include <array>

namespace orv::detail
{

inline constexpr uint32_t STORED = uint32_t(VertexBuffer::AttribUsage::GL_BUFFER);

struct FormatInfo
{
    GLenum glType;
    int size; ///< Bytes of one component.
};

/// By VertexBuffer::AttribFormat.
inline constexpr std::array<FormatInfo, 6> FORMATS = {{{GL_BYTE, 1},
                                                       {GL_UNSIGNED_BYTE, 1},
                                                       {GL_SHORT, 2},
                                                       {GL_UNSIGNED_SHORT, 2},
                                                       {GL_FLOAT, 4},
                                                       {GL_FIXED, 4}}};

/// 0 for an unknown type.
inline int getTypeSize(GLenum glType)
{
    for (const FormatInfo& format : FORMATS)
    {
        if (format.glType == glType)
            return format.size;
    }
    return 0;
}

inline bool hasValidFormat(const AttribRecord& record)
{
    return getTypeSize(record.glType) > 0 && record.componentCount >= 1 && record.componentCount <= 4 &&
           record.stride >= 0;
}

/// Whether commit() or save() would interleave it.
inline bool isToBeInterleaved(const AttribRecord& record)
{
    return record.usage == STORED && record.array;
}

/// Whether at least the first vertex's values are within the size bytes of the GL buffer.
inline bool fits(const AttribRecord& record, unsigned int size)
{
    const int64_t end = int64_t(record.offset) + int64_t(getTypeSize(record.glType)) * record.componentCount;
    return hasValidFormat(record) && record.offset >= 0 && end <= size;
}

} // namespace orv::detail
