#pragma once

#include <cstdint>
#include <string>

namespace convert
{

/// Hash of bytes, the same on every machine (FNV-1a).
inline uint64_t digest(const std::string& text)
{
    uint64_t value = 14695981039346656037u;
    for (const char c : text)
        value = (value ^ uint8_t(c)) * 1099511628211u;
    return value;
}

} // namespace convert
