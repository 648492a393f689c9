#pragma once

#include <cstdint>

/// Numbers as files hold them: the lowest byte first, at any address.
namespace orv::detail
{

inline uint32_t readLittleEndian(const unsigned char* bytes)
{
    return uint32_t(bytes[0]) | uint32_t(bytes[1]) << 8 | uint32_t(bytes[2]) << 16 | uint32_t(bytes[3]) << 24;
}

inline void writeLittleEndian(unsigned char* bytes, uint32_t value)
{
    for (int i = 0; i < 4; ++i)
        bytes[i] = static_cast<unsigned char>(value >> (8 * i));
}

} // namespace orv::detail
