#pragma once

namespace orv
{

/// A piece of a mutable character buffer: from start up to, not including, end. Owns nothing.
///
/// The token reader looks at the character at end in places, so a buffer carries one more byte there; the zero
/// byte that FileToString appends serves.
struct CharRange
{
    char* start = nullptr; ///< The first character.
    char* end = nullptr;   ///< Behind the last one.

    bool empty() const { return start == end; } ///< Whether there are no characters in it.
};

} // namespace orv
