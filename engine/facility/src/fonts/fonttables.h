#pragma once

#include <cstddef>

namespace orv::detail
{

/// Whether a TrueType file keeps the promises that the rasteriser relies on without asking, as far as some
/// characters are concerned: everything that it reads for them lies within the table it belongs to, composite
/// glyphs end, no coordinate leaves 16 bits, and an outline has at most 16384 points.
///
/// @param firstChar,charCount  Unicode code points, at most 65535 of them.
/// @return null, or what is wrong, for a log.
const char* findFontFault(const unsigned char* file, std::size_t size, int firstChar, int charCount);

} // namespace orv::detail
