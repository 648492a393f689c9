#pragma once

#include "orv/memorystream.h"
#include "orv/streamsource.h"

#include <functional>
#include <map>
#include <string>

namespace orv
{

/// Named blocks of memory, for instance assets that are compiled into a program.
class ORV_API MemoryStreamSource : public StreamSource
{
public:
    using Ptr = SharedPtr<MemoryStreamSource>;

    /// Adds a stream. A name that is already held keeps its stream; that, a null name and an empty stream are
    /// logged as errors and change nothing.
    void add(const char* name, const SharedPtr<MemoryStream>& stream);

    bool exists(const char* name) const override;

    /// @return a clone of the stream of that name, so that readers do not disturb each other; empty for an
    /// unknown name, and, after an error record, if writable.
    SharedPtr<Stream> open(const char* name, bool writable) override;

    const char* getName() const override;

private:
    std::map<std::string, SharedPtr<MemoryStream>, std::less<>> m_streams;
};

} // namespace orv
