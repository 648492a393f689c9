#include "orv/indexbuffer.h"

#include "countedgl.h"

#include "orv/detail/bindingepoch.h"
#include "orv/detail/resource.h"
#include "orv/log.h"
#include "orv/rendercontext.h"
#include "orv/renderdevice.h"

#include <algorithm>
#include <iterator>
#include <new>

namespace orv
{

namespace
{

/// By IndexBuffer::Primitive.
constexpr GLenum GL_MODES[] = {GL_POINTS,         GL_LINE_STRIP,   GL_LINE_LOOP, GL_LINES,
                               GL_TRIANGLE_STRIP, GL_TRIANGLE_FAN, GL_TRIANGLES};

GLenum glPrimitiveConvert(IndexBuffer::Primitive primitive)
{
    constexpr bool ORV_FALSE = false;
    if (uint32_t(primitive) < std::size(GL_MODES))
        return GL_MODES[uint32_t(primitive)];
    ORV_ASSERT(ORV_FALSE);
    return GL_POINTS;
}

} // namespace

IndexBuffer::IndexBuffer(Primitive primitive, int count, bool allocate,
                         const SharedPtr<detail::BufferResource>& resource)
    : m_primitive(primitive)
    , m_count(std::max(0, count))
    , m_resource(resource)
{
    if (allocate)
        m_indices.reset(new (std::nothrow) unsigned short[unsigned(m_count)]);
}

IndexBuffer::~IndexBuffer() = default;

void IndexBuffer::commit()
{
    if (m_indices && upload(m_indices.get()))
        m_indices.reset();
}

bool IndexBuffer::commit(const unsigned short* indices)
{
    if (upload(indices))
        return true;
    m_indices.reset(new (std::nothrow) unsigned short[unsigned(m_count)]);
    if (m_indices)
        std::copy_n(indices, m_count, m_indices.get());
    else
        detail::logNoMemory(className());
    return m_indices != nullptr;
}

/// @return false where GL has no buffer: draws go on from an array.
bool IndexBuffer::upload(const unsigned short* indices)
{
    if (!m_resource || !m_resource->allocate())
        return false;
    RenderDevice::getError(false);
    glBindBuffer(GL_ELEMENT_ARRAY_BUFFER, getId());
    glBufferData(GL_ELEMENT_ARRAY_BUFFER, GLsizeiptr(m_count) * 2, indices, GL_STATIC_DRAW);
    const bool isRefused = detail::reportGLError(detail::sourcePathText<__FILE__>, __func__, __LINE__);
    glBindBuffer(GL_ELEMENT_ARRAY_BUFFER, 0);
    detail::bindingsChanged();
    if (isRefused)
    {
        m_resource->deallocate();
        return false;
    }
    m_committed = true;
    return true;
}

void IndexBuffer::draw()
{
    if (!m_enabled)
        return;
    const GLuint buffer = getId();
    if (buffer == 0 && m_committed)
        return;
    const GLenum mode = glPrimitiveConvert(m_primitive);
    if (buffer != 0)
    {
        glBindBuffer(GL_ELEMENT_ARRAY_BUFFER, buffer);
        glDrawElements(mode, m_count, GL_UNSIGNED_SHORT, nullptr);
        glBindBuffer(GL_ELEMENT_ARRAY_BUFFER, 0);
        detail::bindingsChanged();
    }
    else if (m_indices)
    {
        glBindBuffer(GL_ELEMENT_ARRAY_BUFFER, 0);
        glDrawElements(mode, m_count, GL_UNSIGNED_SHORT, m_indices.get());
        detail::bindingsChanged();
    }
    else
        glDrawArrays(mode, 0, m_count);
}

detail::DrawCall IndexBuffer::bind(RenderContext& context)
{
    using Kind = detail::DrawCall::Kind;
    const GLuint buffer = getId();
    if (!m_enabled || (buffer == 0 && m_committed))
        return {};
    const GLenum mode = glPrimitiveConvert(m_primitive);
    if (buffer == 0 && !m_indices)
        return {Kind::IN_ORDER, mode, m_count, nullptr};
    context.getBindings().bindElementBuffer(buffer);
    return {Kind::INDEXED, mode, m_count, buffer != 0 ? nullptr : m_indices.get()};
}

void detail::DrawCall::issue() const
{
    if (kind == Kind::INDEXED)
        glDrawElements(mode, count, GL_UNSIGNED_SHORT, indices);
    else if (kind == Kind::IN_ORDER)
        glDrawArrays(mode, 0, count);
}

unsigned int IndexBuffer::getId() const
{
    return m_resource ? m_resource->getId() : 0;
}

int getTriangleCount(const IndexBuffer& buffer)
{
    switch (buffer.getPrimitive())
    {
    case IndexBuffer::Primitive::TRIANGLE_STRIP:
    case IndexBuffer::Primitive::TRIANGLE_FAN: return buffer.getCount() - 2;
    case IndexBuffer::Primitive::TRIANGLES: return buffer.getCount() / 3;
    default: return 0;
    }
}

} // namespace orv
