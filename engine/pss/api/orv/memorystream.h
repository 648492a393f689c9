#pragma once

#include "orv/stream.h"

namespace orv
{

/// Reads a block of memory. Always valid; cannot be written.
class ORV_API MemoryStream : public Stream
{
public:
    /// @param data  borrowed, and has to outlive the stream and its clones; null reads as nothing.
    /// @param size  in bytes.
    MemoryStream(const void* data, int size);

    /// A new stream over the same bytes, at position 0.
    SharedPtr<MemoryStream> clone() const;

    bool valid() const override;
    bool eof() const override;
    int32_t size() const override;

    /// Goes to position, at most to the end. Position is taken as a signed number: above 2,147,483,647 it counts
    /// as before the start, from where nothing can be read.
    int32_t seek(unsigned int position) override;

    int32_t tell() const override;
    int32_t read(void* buffer, unsigned int count) override;
    int32_t write(const void* buffer, unsigned int count) override;

private:
    const void* m_data;
    int32_t m_size;
    int32_t m_position = 0;
};

} // namespace orv
