#include "filestream.h"

#include <sys/stat.h>

#include <algorithm>
#include <limits>

namespace orv::detail
{

namespace
{

const unsigned int LARGEST = std::numeric_limits<int32_t>::max();

/// Standard streams open directories as well, and opening a pipe would block.
bool isRegularFile(const char* path)
{
    struct stat status;
    return stat(path, &status) == 0 && S_ISREG(status.st_mode);
}

/// A position or size as the interface gives it, -1 for one that does not fit.
int32_t toInt32(std::streamoff offset)
{
    return offset <= std::streamoff(LARGEST) ? int32_t(offset) : -1;
}

} // namespace

FileInputStream::FileInputStream(const char* path)
{
    if (!isRegularFile(path))
    {
        m_file.setstate(std::ios::failbit);
        return;
    }

    m_file.open(path, std::ios::in | std::ios::binary);
    const std::streamoff start = m_file.tellg();
    m_file.seekg(0, std::ios::end);
    m_size = toInt32(m_file.tellg() - start);
    m_file.seekg(start);
    if (m_size < 0)
        m_file.setstate(std::ios::failbit);
}

bool FileInputStream::valid() const
{
    return !m_file.fail(); // also true of a bad stream
}

bool FileInputStream::eof() const
{
    return m_isAtEnd;
}

int32_t FileInputStream::size() const
{
    return m_size;
}

int32_t FileInputStream::seek(unsigned int position)
{
    m_isAtEnd = false;
    m_file.seekg(position, std::ios::beg);
    m_position = toInt32(m_file.tellg());
    return tell();
}

/// Asking the file takes a call of the system.
int32_t FileInputStream::tell() const
{
    return m_file.fail() ? -1 : m_position;
}

int32_t FileInputStream::read(void* buffer, unsigned int count)
{
    if (m_file.bad() || !buffer)
        return 0;

    m_file.read(static_cast<char*>(buffer), std::min(count, LARGEST));
    m_isAtEnd = m_file.eof();
    if (m_isAtEnd)
        m_file.clear(m_file.rdstate() & std::ios::badbit); // a short read is no failure: the stream goes on
    m_position += int32_t(m_file.gcount());
    return int32_t(m_file.gcount());
}

int32_t FileInputStream::write(const void*, unsigned int)
{
    return 0;
}

FileOutputStream::FileOutputStream(const char* path)
{
    m_file.rdbuf()->pubsetbuf(nullptr, 0);
    m_file.open(path, std::ios::out | std::ios::binary | std::ios::trunc);
}

bool FileOutputStream::valid() const
{
    return !m_file.bad();
}

bool FileOutputStream::eof() const
{
    return m_file.eof();
}

int32_t FileOutputStream::size() const
{
    return tell();
}

int32_t FileOutputStream::seek(unsigned int position)
{
    if (m_file.is_open() && !m_file.fail())
        m_file.seekp(position, std::ios::beg);
    return tell();
}

int32_t FileOutputStream::tell() const
{
    return toInt32(m_file.tellp());
}

int32_t FileOutputStream::read(void*, unsigned int)
{
    return 0;
}

int32_t FileOutputStream::write(const void* buffer, unsigned int count)
{
    if (m_file.bad() || !buffer)
        return 0;

    const std::streamsize wanted = std::min(count, LARGEST);
    const std::streamsize taken =
        m_file.fail() ? 0 : m_file.rdbuf()->sputn(static_cast<const char*>(buffer), wanted);
    if (taken < wanted)
        m_file.setstate(std::ios::badbit);
    return int32_t(taken);
}

} // namespace orv::detail
