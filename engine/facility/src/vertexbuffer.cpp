#include "orv/vertexbuffer.h"

#include "orv/detail/bindingepoch.h"
#include "orv/detail/programattrib.h"
#include "orv/detail/resource.h"
#include "orv/detail/revision.h"
#include "orv/rendercontext.h"
#include "orv/renderdevice.h"
#include "orv/stream.h"

#include <GLES2/gl2.h>

#include <algorithm>
#include <cstring>
#include <memory>
#include <new>

namespace orv
{

namespace
{

using detail::AttribRecord;

const uint32_t STORED = uint32_t(VertexBuffer::AttribUsage::GL_BUFFER);

struct FormatInfo
{
    GLenum glType;
    int size; ///< Bytes of one component.
};

/// By VertexBuffer::AttribFormat.
constexpr std::array<FormatInfo, 6> FORMATS = {{{GL_BYTE, 1},
                                                {GL_UNSIGNED_BYTE, 1},
                                                {GL_SHORT, 2},
                                                {GL_UNSIGNED_SHORT, 2},
                                                {GL_FLOAT, 4},
                                                {GL_FIXED, 4}}};

GLenum glAttribFormatConvert(VertexBuffer::AttribFormat format)
{
    return uint32_t(format) < FORMATS.size() ? FORMATS[uint32_t(format)].glType : 0;
}

/// 0 for an unknown type.
int getTypeSize(GLenum glType)
{
    for (const FormatInfo& format : FORMATS)
    {
        if (format.glType == glType)
            return format.size;
    }
    return 0;
}

/// Whether commit() or save() would interleave it.
bool isToBeInterleaved(const AttribRecord& record)
{
    return record.usage == STORED && record.array;
}

bool hasValidFormat(const AttribRecord& record)
{
    return getTypeSize(record.glType) > 0 && record.componentCount >= 1 && record.componentCount <= 4 &&
           record.stride >= 0;
}

/// Whether at least the first vertex's values are within the size bytes of the GL buffer.
bool fits(const AttribRecord& record, unsigned int size)
{
    const int64_t end = int64_t(record.offset) + int64_t(getTypeSize(record.glType)) * record.componentCount;
    return hasValidFormat(record) && record.offset >= 0 && end <= size;
}

/// Whether GL can be given this attribute: it has values somewhere, and GL would take the description.
bool isDrawable(const AttribRecord& record, GLuint buffer)
{
    if (!record.array && (buffer == 0 || record.usage != STORED))
        return false;
    return hasValidFormat(record);
}

/// The buffer to bind for it: values that are still in memory are drawn from there.
GLuint getSourceBuffer(const AttribRecord& record, GLuint buffer)
{
    return record.array ? 0 : buffer;
}

void setPointer(GLuint location, const AttribRecord& record)
{
    const void* pointer = record.array ? static_cast<const void*>(record.array->getBytes())
                                       : reinterpret_cast<const void*>(uintptr_t(record.offset));
    glVertexAttribPointer(location, record.componentCount, record.glType,
                          record.normalised ? GL_TRUE : GL_FALSE, record.stride, pointer);
}

/// The raw form's header and records are sequences of little-endian 32-bit numbers, but for the names.
const int HEADER_SIZE = 12;
const int RECORD_SIZE = 56;
const int NAME_SIZE = 16;

void putNumber(unsigned char* out, uint32_t value)
{
    for (int i = 0; i < 4; ++i)
        out[i] = static_cast<unsigned char>(value >> (8 * i));
}

uint32_t getNumber(const unsigned char* in)
{
    return uint32_t(in[0]) | uint32_t(in[1]) << 8 | uint32_t(in[2]) << 16 | uint32_t(in[3]) << 24;
}

/// Bytes 0 to 23 are the name: a zero-terminated text of at most 15 characters, its end position and its start
/// position (always 0). 28 to 31 and 52 to 55 held pointers once and are 0.
void writeRecord(const AttribRecord& record, unsigned char* out)
{
    std::memset(out, 0, RECORD_SIZE);
    std::memcpy(out, record.name.data(), record.name.size());
    putNumber(out + 16, uint32_t(record.name.size()));
    putNumber(out + 24, record.glType);
    out[32] = record.normalised ? 1 : 0;
    putNumber(out + 36, uint32_t(record.offset));
    putNumber(out + 40, uint32_t(record.componentCount));
    putNumber(out + 44, uint32_t(record.stride));
    putNumber(out + 48, record.usage);
}

/// @return false if it cannot be an attribute of size bytes of data.
bool readRecord(const unsigned char* in, unsigned int size, AttribRecord& record)
{
    if (!std::memchr(in, 0, NAME_SIZE))
        return false;
    record.name = reinterpret_cast<const char*>(in);
    record.glType = getNumber(in + 24);
    record.normalised = in[32] != 0;
    record.offset = int(getNumber(in + 36));
    record.componentCount = int(getNumber(in + 40));
    record.stride = int(getNumber(in + 44));
    record.usage = getNumber(in + 48);
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

VertexBuffer::VertexBuffer(const SharedPtr<detail::BufferResource>& resource)
    : m_resource(resource)
    , m_revision(detail::nextRevision())
{
}

VertexBuffer::~VertexBuffer() = default;

bool VertexBuffer::addAttrib(const SharedPtr<VertexArray>& array, const char* name, AttribFormat format,
                             AttribUsage usage, bool normalise)
{
    const GLenum glType = glAttribFormatConvert(format);
    if (!array || !name || getTypeSize(glType) > array->getTypeSize())
    {
        ORV_LOG_ERROR("Vertex attribute \"%s\": format %u needs components of %d bytes, the array has %d",
                      name ? name : "", unsigned(format), getTypeSize(glType),
                      array ? array->getTypeSize() : 0);
        return false;
    }
    AttribRecord record;
    record.name = name;
    record.glType = glType;
    record.array = array;
    record.normalised = normalise;
    record.componentCount = array->getComponentCount();
    record.usage = uint32_t(usage);
    m_attribs.insert(m_attribs.begin(), std::move(record));
    attribsChanged();
    return true;
}

void VertexBuffer::getSizeAndStride(unsigned int& size, int& stride) const
{
    size = 0;
    stride = 0;
    for (const AttribRecord& record : m_attribs)
    {
        if (!isToBeInterleaved(record))
            continue;
        size += record.array->getSizeInBytes();
        stride += record.array->getVertexSize();
    }
}

bool VertexBuffer::createTempData(unsigned int size, int stride, unsigned char* out)
{
    for (const AttribRecord& record : m_attribs)
    {
        if (isToBeInterleaved(record) && uint64_t(record.array->getVertexCount()) * unsigned(stride) != size)
        {
            ORV_LOG_ERROR("Vertex attribute \"%s\" has %d vertices, not the %u of the whole buffer",
                          record.name.c_str(), record.array->getVertexCount(),
                          stride > 0 ? size / unsigned(stride) : 0);
            return false;
        }
    }

    int offset = 0;
    for (AttribRecord& record : m_attribs)
    {
        if (!isToBeInterleaved(record))
            continue;
        record.stride = stride;
        record.offset = offset;
        const int vertexSize = record.array->getVertexSize();
        const unsigned char* in = record.array->getBytes();
        for (int i = 0; i < record.array->getVertexCount(); ++i)
            std::memcpy(out + std::size_t(i) * unsigned(stride) + offset,
                        in + std::size_t(i) * unsigned(vertexSize), unsigned(vertexSize));
        offset += vertexSize;
        record.array = nullptr;
    }
    attribsChanged();
    return true;
}

void VertexBuffer::commit()
{
    unsigned int size = 0;
    int stride = 0;
    getSizeAndStride(size, stride);
    if (size == 0 || !m_resource || !m_resource->allocate())
        return;

    const std::unique_ptr<unsigned char[]> data(new (std::nothrow) unsigned char[size]);
    if (!data)
        ORV_LOG_ERROR("Unable to create temporary buffer");
    if (!data || !createTempData(size, stride, data.get()))
    {
        m_resource->deallocate();
        return;
    }
    upload(data.get(), size);
}

bool VertexBuffer::setAllAttributes(const AttribDescription* descriptions, unsigned int count,
                                    const unsigned char* data, unsigned int size)
{
    if ((count > 0 && !descriptions) || (size > 0 && !data))
    {
        ORV_LOG_ERROR("%u attributes or %u bytes of vertices missing", count, size);
        return false;
    }
    if (!m_resource || !m_resource->allocate())
        return false;

    m_attribs.clear();
    for (unsigned int i = 0; i < count; ++i)
    {
        const AttribDescription& description = descriptions[i];
        AttribRecord record;
        record.name = description.name;
        record.glType = glAttribFormatConvert(description.format);
        record.normalised = description.normalised;
        record.offset = description.offset;
        record.componentCount = description.componentCount;
        record.stride = description.stride;
        if (record.glType != 0 && !fits(record, size))
        {
            ORV_LOG_ERROR(
                "Vertex attribute \"%s\" (offset %d, %d components, stride %d) does not fit %u bytes",
                record.name.c_str(), record.offset, record.componentCount, record.stride, size);
            record.glType = 0;
        }
        m_attribs.push_back(std::move(record));
    }
    return upload(data, size);
}

bool VertexBuffer::enableAttrib(unsigned int location, const char* name)
{
    const AttribRecord* record = findAttrib(name);
    const GLuint buffer = getId();
    detail::bindingsChanged();
    if (!record || !isDrawable(*record, buffer))
    {
        glDisableVertexAttribArray(location);
        return false;
    }
    glBindBuffer(GL_ARRAY_BUFFER, getSourceBuffer(*record, buffer));
    glEnableVertexAttribArray(location);
    setPointer(location, *record);
    return true;
}

void VertexBuffer::bindAttribs(RenderContext& context, uint64_t programRevision,
                               const detail::ProgramAttrib* attribs, int count)
{
    if (context.isVertexInputBound(programRevision, m_revision))
        return;
    const Plan& plan = getPlan(programRevision, attribs, count);
    const GLuint buffer = getId();
    uint32_t enabled = 0;
    for (int i = 0; i < count; ++i)
    {
        const GLuint location = unsigned(attribs[i].location);
        const AttribRecord* record = plan.sources[unsigned(i)];
        if (!record || !isDrawable(*record, buffer))
        {
            context.setAttribOnes(location);
            continue;
        }
        context.bindArrayBuffer(getSourceBuffer(*record, buffer));
        setPointer(location, *record);
        enabled |= 1u << location;
    }
    context.setAttribArrays(enabled);
    context.setVertexInputBound(programRevision, m_revision);
}

bool VertexBuffer::isLost() const
{
    const auto isStored = [](const AttribRecord& record) { return record.usage == STORED && !record.array; };
    return getId() == 0 && std::any_of(m_attribs.begin(), m_attribs.end(), isStored);
}

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
    putNumber(header, size);
    putNumber(header + 4, uint32_t(stride));
    putNumber(header + 8, uint32_t(m_attribs.size()));
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
    const uint32_t size = getNumber(header);
    const uint32_t count = getNumber(header + 8);
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

unsigned int VertexBuffer::getId() const
{
    return m_resource ? m_resource->getId() : 0;
}

const AttribRecord* VertexBuffer::findAttrib(const char* name) const
{
    const auto found =
        std::find_if(m_attribs.begin(), m_attribs.end(),
                     [name](const AttribRecord& record) { return name && record.name == name; });
    return found != m_attribs.end() ? &*found : nullptr;
}

const VertexBuffer::Plan& VertexBuffer::getPlan(uint64_t programRevision,
                                                const detail::ProgramAttrib* attribs, int count)
{
    for (const Plan& plan : m_plans)
    {
        if (plan.programRevision == programRevision)
            return plan;
    }
    Plan& plan = m_plans[m_nextPlan];
    m_nextPlan = (m_nextPlan + 1) % unsigned(m_plans.size());
    plan.programRevision = programRevision;
    plan.sources.clear();
    for (int i = 0; i < count; ++i)
        plan.sources.push_back(findAttrib(attribs[i].name.c_str()));
    return plan;
}

/// @return false if GL has no memory for it: a draw from a buffer without data would read from anywhere, so the
/// buffer is lost.
bool VertexBuffer::upload(const unsigned char* data, unsigned int size)
{
    RenderDevice::getError(false);
    glBindBuffer(GL_ARRAY_BUFFER, getId());
    glBufferData(GL_ARRAY_BUFFER, GLsizeiptr(size), data, GL_STATIC_DRAW);
    const bool isRefused = detail::reportGLError("engine/facility/src/vertexbuffer", __func__, __LINE__);
    if (isRefused)
        m_resource->deallocate();
    attribsChanged();
    detail::bindingsChanged();
    return !isRefused;
}

void VertexBuffer::attribsChanged()
{
    m_revision = detail::nextRevision();
    const detail::AttribRecord* weights = findAttrib("a_weights");
    m_lacksLastWeight = weights && weights->componentCount < 4;
    for (Plan& plan : m_plans)
        plan.programRevision = 0; // 0 is no program's; the records that it points to may have moved
}

} // namespace orv
