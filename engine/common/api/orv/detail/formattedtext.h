#pragma once

#include <cstdarg>
#include <cstdio>
#include <memory>
#include <new>

namespace orv::detail
{

/// What printf makes of a format; cut to 255 characters where there is no memory for more.
class FormattedText
{
public:
    FormattedText(const char* format, va_list arguments)
    {
        va_list again;
        va_copy(again, arguments);
        const int size = std::vsnprintf(m_text, sizeof(m_text), format, arguments);
        if (size >= int(sizeof(m_text)))
            m_whole.reset(new (std::nothrow) char[std::size_t(size) + 1]);
        if (m_whole)
            std::vsnprintf(m_whole.get(), std::size_t(size) + 1, format, again);
        va_end(again);
    }

    const char* get() const { return m_whole ? m_whole.get() : m_text; }

private:
    char m_text[256] = {};
    std::unique_ptr<char[]> m_whole;
};

} // namespace orv::detail
