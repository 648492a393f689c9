#include "orv/memorystreamsource.h"

#include "orv/log.h"

namespace orv
{

void MemoryStreamSource::add(const char* name, const SharedPtr<MemoryStream>& stream)
{
    if (!name || !stream)
    {
        ORV_LOG_ERROR("MemoryStream without %s not added to source", name ? "bytes" : "a name");
        return;
    }
    if (exists(name))
    {
        ORV_LOG_ERROR("MemoryStream \"%s\" already added to source", name);
        return;
    }
    m_streams.emplace(name, stream);
}

bool MemoryStreamSource::exists(const char* name) const
{
    return name && m_streams.find(name) != m_streams.end();
}

SharedPtr<Stream> MemoryStreamSource::open(const char* name, bool writable)
{
    if (writable)
    {
        ORV_LOG_ERROR("MemoryStream streams cannot be writable: %s", name ? name : "");
        return nullptr;
    }
    if (!exists(name))
        return nullptr;
    return m_streams.find(name)->second->clone();
}

const char* MemoryStreamSource::getName() const
{
    return "MemoryStreamSource";
}

} // namespace orv
