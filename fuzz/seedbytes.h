#pragma once

#include "seeds.h"

namespace hostile
{

// What the writers of seeds have in common.

inline Bytes toBytes(const std::string& text)
{
    return Bytes(text.begin(), text.end());
}

inline Bytes join(const std::vector<Bytes>& pieces)
{
    Bytes all;
    for (const Bytes& piece : pieces)
        all.insert(all.end(), piece.begin(), piece.end());
    return all;
}

inline Bytes little(uint32_t value, int size = 4)
{
    Bytes bytes;
    for (int i = 0; i < size; ++i)
        bytes.push_back(uint8_t(value >> (8 * i)));
    return bytes;
}

inline Bytes big(uint32_t value, int size = 4)
{
    Bytes bytes = little(value, size);
    return Bytes(bytes.rbegin(), bytes.rend());
}

} // namespace hostile
