#pragma once

#include <cstddef>

namespace orv::detail
{

/// Whether a JPEG file keeps the promises that the decoder relies on without asking: a Huffman table has at
/// most 256 symbols, and a scan uses tables that the file has defined. A decoder led astray by a damaged file
/// would write or read outside its memory.
///
/// True for files that are no JPEG, and for damage that the decoder notices by itself.
bool hasSoundHuffmanTables(const unsigned char* file, std::size_t size);

} // namespace orv::detail
