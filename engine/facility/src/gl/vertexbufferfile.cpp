// The raw form of a vertex buffer in a stream; the rest of the class is in vertexbuffer.cpp.

#include "orv/vertexbuffer.h"

#include "attribformat.h"

#include "orv/detail/littleendian.h"
#include "orv/detail/resource.h"
#include "orv/log.h"
#include "orv/stream.h"

#include <algorithm>
#include <cstring>
#include <memory>
#include <new>

namespace orv
{

namespace
{

using detail::AttribRecord;
using detail::fits;
using detail::readLittleEndian;
using detail::STORED;
using detail::writeLittleEndian;

/// The raw form's header and records are sequences of little-endian 32-bit numbers, but for the names.
const int HEADER_SIZE = 12;
const int RECORD_SIZE = 56;
const int NAME_SIZE = 16;

/// Bytes 0 to 23 are the name: a zero-terminated text of at most 15 characters, its end position and its start
/// position (always 0). 28 to 31 and 52 to 55 are 0.
void writeRecord(const AttribRecord& record, unsigned char* out)
{
    std::memset(out, 0, RECORD_SIZE);
    std::memcpy(out, record.name.data(), record.name.size());
    writeLittleEndian(out + 16, uint32_t(record.name.size()));
    writeLittleEndian(out + 24, record.glType);
    out[32] = record.normalised ? 1 : 0;
    writeLittleEndian(out + 36, uint32_t(record.offset));
    writeLittleEndian(out + 40, uint32_t(record.componentCount));
    writeLittleEndian(out + 44, uint32_t(record.stride));
    writeLittleEndian(out + 48, record.usage);
}

/// @return false if it does not fit into size bytes of data.
bool readRecord(const unsigned char* in, unsigned int size, AttribRecord& record)
{
    if (!std::memchr(in, 0, NAME_SIZE))
        return false;
    record.name = reinterpret_cast<const char*>(in);
    record.glType = readLittleEndian(in + 24);
    record.normalised = in[32] != 0;
    record.offset = int(readLittleEndian(in + 36));
    record.componentCount = int(readLittleEndian(in + 40));
    record.stride = int(readLittleEndian(in + 44));
    record.usage = readLittleEndian(in + 48);
    return record.usage != STORED || fits(record, size);
}

bool readAll(Stream& stream, unsigned char* out, unsigned int size)
{
    return size == 0 || stream.read(out, size) == int32_t(size);
}

bool writeAll(Stream& stream, const unsigned char* data, unsigned int size)
{
    return size == 0 || stream.write(data, size) == int32_t(size);
}

} // namespace

bool VertexBuffer::save(const SharedPtr<Stream>& stream)
{
    if (getId() != 0)
    {
        ORV_LOG_ERROR("Can't write buffer to file (already committed).");
        return false;
    }
    if (!stream || isLost())
    {
        ORV_LOG_ERROR("Can't write buffer to file (%s).", stream ? "its data is gone" : "no file");
        return false;
    }
    for (const AttribRecord& record : m_attribs)
    {
        if (record.name.size() >= NAME_SIZE)
        {
            ORV_LOG_ERROR("Can't write buffer to file (attribute name \"%s\" has more than %d characters).",
                          record.name.c_str(), NAME_SIZE - 1);
            return false;
        }
    }

    unsigned int size = 0;
    int stride = 0;
    getSizeAndStride(size, stride);
    const std::unique_ptr<unsigned char[]> tempData(new (std::nothrow) unsigned char[size]);
    ORV_ASSERT(tempData);
    if (!tempData || !createTempData(size, stride, tempData.get()))
        return false;

    unsigned char header[HEADER_SIZE];
    writeLittleEndian(header, size);
    writeLittleEndian(header + 4, uint32_t(stride));
    writeLittleEndian(header + 8, uint32_t(m_attribs.size()));
    bool isWritten = writeAll(*stream, header, HEADER_SIZE);
    for (const AttribRecord& record : m_attribs)
    {
        unsigned char block[RECORD_SIZE];
        writeRecord(record, block);
        isWritten = isWritten && writeAll(*stream, block, RECORD_SIZE);
    }
    if (!isWritten || !writeAll(*stream, tempData.get(), size))
    {
        ORV_LOG_ERROR("Can't write buffer to file (it does not take all).");
        return false;
    }
    return true;
}

bool VertexBuffer::load(const SharedPtr<Stream>& stream)
{
    unsigned char header[HEADER_SIZE];
    if (!stream || !readAll(*stream, header, HEADER_SIZE))
    {
        ORV_LOG_ERROR("Can't read vertex buffer: no header");
        return false;
    }
    const uint32_t size = readLittleEndian(header);
    const uint32_t count = readLittleEndian(header + 8);
    const int64_t rest = int64_t(stream->size()) - stream->tell();
    if (int64_t(size) + int64_t(count) * RECORD_SIZE > rest)
    {
        ORV_LOG_ERROR(
            "Can't read vertex buffer: %u attributes and %u bytes of vertices wanted, %lld bytes left", count,
            size, static_cast<long long>(rest));
        return false;
    }

    std::vector<AttribRecord> attribs(count);
    for (AttribRecord& record : attribs)
    {
        unsigned char block[RECORD_SIZE];
        if (!readAll(*stream, block, RECORD_SIZE) || !readRecord(block, size, record))
        {
            ORV_LOG_ERROR("Can't read vertex buffer: bad attribute \"%s\"", record.name.c_str());
            return false;
        }
    }
    if (size != 0)
    {
        const std::unique_ptr<unsigned char[]> tempData(new (std::nothrow) unsigned char[size]);
        ORV_ASSERT(tempData);
        if (!tempData)
            return false;
        if (!readAll(*stream, tempData.get(), size))
        {
            ORV_LOG_ERROR("Can't read vertex buffer: %u bytes of vertices wanted", size);
            return false;
        }
        if (!m_resource || !m_resource->allocate())
            return false;
        if (!upload(tempData.get(), size))
            return false;
    }
    m_attribs = std::move(attribs);
    attribsChanged();
    return true;
}

} // namespace orv
