#pragma once

#include <cstddef>

namespace orv::detail
{

/// Whether a JPEG file keeps the promises that the decoder relies on without asking: a Huffman table has at
/// most 256 symbols, a scan uses tables that the file has defined, and the scans together do not go over the picture
/// more often than its blocks and the file's bytes account for. A decoder led astray by a damaged file would write or
/// read outside its memory, or take minutes.
///
/// True for files that are no JPEG, and for damage that the decoder notices by itself.
bool isSoundJpeg(const unsigned char* file, std::size_t size);

} // namespace orv::detail
