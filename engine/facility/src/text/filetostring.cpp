#include "orv/filetostring.h"

#include "orv/detail/loadscope.h"
#include "orv/filestreamsource.h"
#include "orv/stream.h"

#include <algorithm>
#include <new>
#include <utility>

namespace orv
{

FileToString::FileToString(Stream& stream)
{
    read(stream);
}

FileToString::FileToString(const char* path)
{
    const SharedPtr<StreamSource> source = makeShared<FileStreamSource>(".");
    if (!source || !source->exists(path))
        return;
    if (const SharedPtr<Stream> stream = source->open(path, false))
        read(*stream);
}

FileToString::FileToString(FileToString&& other) noexcept
    : m_text(std::move(other.m_text))
    , m_end(std::exchange(other.m_end, nullptr))
{
}

FileToString& FileToString::operator=(FileToString&& other) noexcept
{
    m_text.swap(other.m_text);
    std::swap(m_end, other.m_end);
    return *this;
}

void FileToString::read(Stream& stream)
{
    // A packaged asset that was read past its end reports a position beyond its size.
    const int32_t rest = std::max(0, std::max(0, stream.size()) - std::max(0, stream.tell()));
    m_text.reset(new (std::nothrow) char[std::size_t(rest) + 1]);
    m_end = m_text.get();
    if (!m_text)
        return;
    m_end += std::clamp(stream.read(m_text.get(), unsigned(rest)), 0, rest);
    *m_end = '\0';
    detail::LoadScope::addRead(m_text.get(), std::size_t(m_end - m_text.get()));
}

} // namespace orv
