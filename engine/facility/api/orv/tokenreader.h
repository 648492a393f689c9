#pragma once

#include "orv/charrange.h"
#include "orv/export.h"

namespace orv
{

/// The lexical layer of the text formats. Each function takes what it reads off the start of the range and never
/// moves the end. Nothing is reported: what cannot be read becomes the default, and the caller decides. White
/// space is blank, tab, line feed, vertical tab, form feed and carriage return; lines and comments mean nothing
/// here.

ORV_API void eatWhite(CharRange& range);

/// Skips white space, then consumes c. @return false, with the white space gone, if something else is there.
ORV_API bool requireChar(CharRange& range, int c);

/// Moves to the next c, which is not consumed, or to the end.
ORV_API void readTo(CharRange& range, int c);

/// The next word, or everything between two double quotes; empty at the end of the range.
///
/// The white space or closing quote behind the token is overwritten with a zero byte and consumed, so the token
/// is a zero-terminated text inside the buffer, and a range cannot be read twice.
ORV_API CharRange readToken(CharRange& range);

/// Decimal text with an optional sign, point and exponent, in single precision throughout.
/// @return defaultValue only where nothing is left to read; text that is no number reads as 0 and stays in the
/// range.
ORV_API float readFloat(CharRange& range, float defaultValue);

/// Decimal digits behind an optional sign. @return defaultValue if no digit follows (the sign stays consumed).
/// A value beyond 32 bits wraps.
ORV_API int readInt(CharRange& range, int defaultValue);

/// As readInt, without a sign.
ORV_API unsigned int readUInt(CharRange& range, unsigned int defaultValue);

/// Reads a token. @return whether it begins with '1', 't' or 'T'; false if there is none.
ORV_API bool readBool(CharRange& range);

} // namespace orv
