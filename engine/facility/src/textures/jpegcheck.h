#pragma once

#include <cstddef>

namespace orv::detail
{

/// Whether a JPEG file meets the conditions that the decoder does not check: a Huffman table has at most 256 symbols, a
/// scan uses only defined tables, and the number of scans is limited by the picture's blocks and the file's bytes.
/// Otherwise the decoder would read or write out of bounds, or take minutes.
///
/// True also for files other than JPEG, and for damage that the decoder detects itself.
bool isSoundJpeg(const unsigned char* file, std::size_t size);

} // namespace orv::detail
