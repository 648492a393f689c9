#pragma once

#include "orv/stream.h"
#include "orv/streamsource.h"

namespace view
{

/// Another source, which has no streams while it is not used.
class SwitchedSource : public orv::StreamSource
{
public:
    explicit SwitchedSource(const orv::SharedPtr<orv::StreamSource>& source) : m_source(source) {}

    bool exists(const char* name) const override { return m_isUsed && m_source->exists(name); }

    orv::SharedPtr<orv::Stream> open(const char* name, bool writable) override
    {
        return m_isUsed ? m_source->open(name, writable) : orv::SharedPtr<orv::Stream>();
    }

    const char* getName() const override { return m_source->getName(); }

    void setUsed(bool used) { m_isUsed = used; }

private:
    orv::SharedPtr<orv::StreamSource> m_source;
    bool m_isUsed = false;
};

} // namespace view
