#include "filestream.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <sys/uio.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <limits>

namespace orv::detail
{

namespace
{

const unsigned int LARGEST = std::numeric_limits<int32_t>::max();

/// A position or size as the interface gives it, -1 for one that does not fit.
int32_t toInt32(int64_t offset)
{
    return offset <= int64_t(LARGEST) ? int32_t(offset) : -1;
}

} // namespace

void FileDescriptor::close()
{
    if (isOpen())
        ::close(m_number);
    m_number = -1;
}

/// A pipe is opened without waiting for its writer, to see that it is none of our files.
FileInputStream::FileInputStream(const char* path)
    : m_file(open(path, O_RDONLY | O_CLOEXEC | O_NONBLOCK | O_NOCTTY))
{
    struct stat status;
    if (m_file.isOpen() && fstat(m_file.get(), &status) == 0 && S_ISREG(status.st_mode))
        m_size = toInt32(status.st_size);
    if (m_size < 0)
        m_file.close();
}

bool FileInputStream::valid() const
{
    return m_file.isOpen() && !m_isBad;
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
    m_position = toInt32(position);
    return tell();
}

int32_t FileInputStream::tell() const
{
    return valid() ? m_position : -1;
}

int32_t FileInputStream::read(void* buffer, unsigned int count)
{
    if (!valid() || !buffer)
        return 0;

    const int32_t wanted = int32_t(std::min(count, LARGEST));
    const int32_t most = std::min(wanted, m_position < 0 ? 0 : int32_t(LARGEST) - m_position);
    const int32_t taken = readBuffered(static_cast<unsigned char*>(buffer), most);
    m_position += taken;
    m_isAtEnd = !m_isBad && taken < wanted;
    return taken;
}

int32_t FileInputStream::readBuffered(unsigned char* bytes, int32_t count)
{
    const int32_t inBuffer = m_position - m_bufferStart;
    int32_t taken = 0;
    if (inBuffer >= 0 && inBuffer < m_bufferedSize)
    {
        taken = std::min(count, m_bufferedSize - inBuffer);
        std::memcpy(bytes, m_buffer + inBuffer, size_t(taken));
    }
    return taken < count ? taken + readFile(bytes + taken, count - taken, m_position + taken) : taken;
}

/// From a place of the file to memory, and what follows to the buffer, in one call of the system.
/// @return less than count at the end of the file, or if the system refuses.
int32_t FileInputStream::readFile(unsigned char* bytes, int32_t count, int32_t position)
{
    const int64_t filePosition = int64_t(m_bufferStart) + m_bufferedSize;
    if (filePosition != position && lseek(m_file.get(), off_t(position), SEEK_SET) < 0)
        m_isBad = true;
    m_bufferedSize = 0;
    int32_t taken = 0;
    while (taken < count && !m_isBad)
    {
        const int32_t rest = count - taken;
        const iovec parts[] = {{bytes + taken, size_t(rest)}, {m_buffer, sizeof(m_buffer)}};
        const ssize_t some = readv(m_file.get(), parts, 2);
        if (some < 0 && errno == EINTR)
            continue;
        m_isBad = some < 0;
        if (some <= 0)
            break;
        taken += int32_t(std::min<ssize_t>(some, rest));
        m_bufferedSize = int32_t(std::max<ssize_t>(some - rest, 0));
    }
    m_bufferStart = position + taken;
    return taken;
}

int32_t FileInputStream::write(const void*, unsigned int)
{
    return 0;
}

FileOutputStream::FileOutputStream(const char* path)
    : m_file(open(path, O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC | O_NOCTTY, 0666))
{
}

bool FileOutputStream::valid() const
{
    return !m_isBad;
}

bool FileOutputStream::eof() const
{
    return false;
}

int32_t FileOutputStream::size() const
{
    return tell();
}

int32_t FileOutputStream::seek(unsigned int position)
{
    if (m_file.isOpen() && !m_isBad && lseek(m_file.get(), off_t(position), SEEK_SET) >= 0)
        m_position = position;
    return tell();
}

int32_t FileOutputStream::tell() const
{
    return m_file.isOpen() && !m_isBad ? toInt32(m_position) : -1;
}

int32_t FileOutputStream::read(void*, unsigned int)
{
    return 0;
}

int32_t FileOutputStream::write(const void* buffer, unsigned int count)
{
    if (m_isBad || !buffer)
        return 0;

    const int32_t wanted = int32_t(std::min(count, LARGEST));
    int32_t taken = 0;
    while (m_file.isOpen() && taken < wanted)
    {
        const ssize_t some =
            ::write(m_file.get(), static_cast<const unsigned char*>(buffer) + taken, size_t(wanted - taken));
        if (some < 0 && errno == EINTR)
            continue;
        if (some <= 0)
            break;
        taken += int32_t(some);
    }
    m_isBad = taken < wanted;
    m_position += taken;
    return taken;
}

} // namespace orv::detail
