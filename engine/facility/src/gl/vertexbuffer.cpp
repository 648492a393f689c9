#include "orv/vertexbuffer.h"

#include "attribformat.h"

#include "orv/detail/bindingepoch.h"
#include "orv/detail/resource.h"
#include "orv/detail/revision.h"
#include "orv/log.h"
#include "orv/renderdevice.h"

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
using detail::getTypeSize;
using detail::isToBeInterleaved;
using detail::STORED;

GLenum glAttribFormatConvert(VertexBuffer::AttribFormat format)
{
    return uint32_t(format) < detail::FORMATS.size() ? detail::FORMATS[uint32_t(format)].glType : 0;
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

bool VertexBuffer::replaceData(const unsigned char* data, unsigned int size)
{
    return data && getId() != 0 && upload(data, size);
}

bool VertexBuffer::isLost() const
{
    const auto isStored = [](const AttribRecord& record) { return record.usage == STORED && !record.array; };
    return getId() == 0 && std::any_of(m_attribs.begin(), m_attribs.end(), isStored);
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

/// @return false if GL has no memory: drawing from a buffer without data would read arbitrary memory, so the buffer
/// counts as lost.
bool VertexBuffer::upload(const unsigned char* data, unsigned int size)
{
    RenderDevice::getError(false);
    glBindBuffer(GL_ARRAY_BUFFER, getId());
    glBufferData(GL_ARRAY_BUFFER, GLsizeiptr(size), data, GL_STATIC_DRAW);
    const bool isRefused = detail::reportGLError(detail::sourcePathText<__FILE__>, __func__, __LINE__);
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
        plan.programRevision = 0; // of no program: the plan's records may have moved
    m_nextPlan = 0;               // their memory is reused
}

} // namespace orv
