// The draw path of VertexBuffer; the rest of the class is in vertexbuffer.cpp.

#include "orv/vertexbuffer.h"

#include "attribformat.h"

#include "orv/detail/bindingepoch.h"
#include "orv/detail/programattrib.h"
#include "orv/rendercontext.h"

namespace orv
{

namespace
{

using detail::AttribRecord;
using detail::hasValidFormat;
using detail::STORED;

/// Whether GL can use this attribute: it has values, and a valid description.
bool isDrawable(const AttribRecord& record, GLuint buffer)
{
    if (!record.array && (buffer == 0 || record.usage != STORED))
        return false;
    return hasValidFormat(record);
}

/// The buffer to bind for it: 0 if its values are still in memory.
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

} // namespace

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
    detail::Bindings& bindings = context.getBindings();
    if (bindings.isVertexInputBound(programRevision, m_revision))
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
            bindings.setAttribOnes(location);
            continue;
        }
        bindings.bindArrayBuffer(getSourceBuffer(*record, buffer));
        setPointer(location, *record);
        enabled |= 1u << location;
    }
    bindings.setAttribArrays(enabled);
    bindings.setVertexInputBound(programRevision, m_revision);
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

} // namespace orv
