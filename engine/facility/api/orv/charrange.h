#pragma once

namespace orv
{

/// A piece of a mutable character buffer: from start up to, not including, end. Owns nothing.
///
/// The token reader looks at the character at end in places, so a buffer carries one more byte there; the zero
/// byte that FileToString appends serves.
struct CharRange
{
    char* start = nullptr;
    char* end = nullptr;

    bool empty() const { return start == end; }
};

} // namespace orv
