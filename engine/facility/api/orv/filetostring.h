#pragma once

#include "orv/charrange.h"
#include "orv/export.h"

#include <memory>

namespace orv
{

class Stream;

/// A whole text in memory, followed by one zero byte, ready for the token reader.
///
/// It can be moved and not copied. Both pointers are null until something was read: after a missing file, or where there is no memory for it.
class ORV_API FileToString
{
public:
    /// Reads what is left of the stream.
    explicit FileToString(Stream& stream);

    /// @param path  relative to the working directory.
    explicit FileToString(const char* path);

    /// Takes the text over; the other one is empty afterwards.
    FileToString(FileToString&& other) noexcept;
    FileToString& operator=(FileToString&& other) noexcept;

    /// Replaces the text by what is left of the stream. A short read gives a shorter text.
    void read(Stream& stream);

    char* getStart() const { return m_text.get(); } ///< The text, ended by a NUL.
    char* getEnd() const { return m_end; }          ///< Points at the zero byte.
    CharRange getRange() const { return {m_text.get(), m_end}; }

private:
    std::unique_ptr<char[]> m_text;
    char* m_end = nullptr;
};

} // namespace orv
