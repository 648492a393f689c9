#pragma once

#include <cstdlib>

#include <zlib.h>

namespace headless
{

/// For STBIW_ZLIB_COMPRESS: stb's own function takes four times as long and compresses less.
/// @return null, or to be freed.
inline unsigned char* compressForPng(unsigned char* data, int size, int* compressedSize, int)
{
    constexpr int LEVEL = 4;
    uLongf room = compressBound(uLong(size));
    auto* compressed = static_cast<unsigned char*>(std::malloc(room));
    if (compressed && compress2(compressed, &room, data, uLong(size), LEVEL) == Z_OK)
    {
        *compressedSize = int(room);
        return compressed;
    }
    std::free(compressed);
    return nullptr;
}

} // namespace headless
