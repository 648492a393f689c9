#include "orv/memorystream.h"

#include <algorithm>
#include <cstring>

namespace orv
{

MemoryStream::MemoryStream(const void* data, int size) : m_data(data), m_size(size) {}

SharedPtr<MemoryStream> MemoryStream::clone() const
{
    return makeShared<MemoryStream>(m_data, m_size);
}

bool MemoryStream::valid() const
{
    return true;
}

bool MemoryStream::eof() const
{
    return m_position >= m_size;
}

int32_t MemoryStream::size() const
{
    return m_size;
}

int32_t MemoryStream::seek(unsigned int position)
{
    m_position = std::min(int32_t(position), m_size);
    return m_position;
}

int32_t MemoryStream::tell() const
{
    return m_position;
}

int32_t MemoryStream::read(void* buffer, unsigned int count)
{
    if (!m_data || !buffer || m_position < 0)
        return 0;

    const int32_t taken = int32_t(std::min<int64_t>(m_size - m_position, count));
    if (taken < 1)
        return taken;

    std::memcpy(buffer, static_cast<const char*>(m_data) + m_position, size_t(taken));
    m_position += taken;
    return taken;
}

int32_t MemoryStream::write(const void*, unsigned int)
{
    return 0;
}

} // namespace orv
