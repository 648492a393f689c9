#pragma once

#include "orv/export.h"
#include "orv/shared.h"
#include "orv/sharedptr.h"

#include <cstdint>

namespace orv
{

/// A seekable sequence of bytes of known size, at most 2,147,483,647.
///
/// A stream is readable or writable, as its source opened it; the other direction transfers 0 bytes.
/// Threads: no locks, one thread at a time.
class ORV_API Stream : public Shared
{
public:
    using Ptr = SharedPtr<Stream>;

    ORV_CLASS_NAME("Stream")

    /// Opened successfully and not in a failed state.
    virtual bool valid() const = 0;

    /// What the end is depends on the stream: a file is at its end only after a read wanted more than was left,
    /// memory and packaged assets as soon as their last byte was read.
    virtual bool eof() const = 0;

    /// In bytes, the whole stream.
    virtual int32_t size() const = 0;

    /// @param position  in bytes from the start.
    /// @return the new position, negative if it could not be reached.
    virtual int32_t seek(unsigned int position) = 0;

    /// In bytes from the start; negative when the position is unknown, as it is for a file in a failed state.
    virtual int32_t tell() const = 0;

    /// @return the number of bytes read, which is less than count at the end of the stream.
    virtual int32_t read(void* buffer, unsigned int count) = 0;

    /// @return the number of bytes written.
    virtual int32_t write(const void* buffer, unsigned int count) = 0;
};

} // namespace orv
