#pragma once

#include "pvr/pvrfile.h"

namespace pvr
{

/// The format that unpack() writes: RGBA_8888, RGB_888, RGB_565, RGBA_4444, RGBA_5551, LA_88, L_8 or A_8. Compressed
/// pixels are decoded to RGBA_8888; other formats differ in the order of their channels at most.
Format getUnpackedFormat(Format format);

/// Bytes that unpack() writes for a level.
uint64_t getUnpackedSize(const PvrFile& file, const Level& level);

/// Writes the pixels of a level, top row first, without padding, 16-bit words in the byte order of this machine.
/// \param data the whole file that `file` was made from
/// \param pixels room for getUnpackedSize() bytes
/// \return false if the decoder refuses the level
bool unpack(const PvrFile& file, const uint8_t* data, const Level& level, uint8_t* pixels);

} // namespace pvr
