#include "terminaltext.h"

#include <algorithm>
#include <cstdint>
#include <cstdio>

namespace commandline
{

namespace
{

/// The code point that begins there; its length is 0 if it is invalid UTF-8.
uint32_t readCodePoint(const std::string& text, size_t at, size_t& length)
{
    const auto byte = [&](size_t i) { return i < text.size() ? uint32_t(uint8_t(text[i])) : 0u; };
    const uint32_t first = byte(at);
    constexpr uint32_t LEAST[] = {0, 0, 0x80, 0x800, 0x10000};
    length = first < 0x80 ? 1 : first >> 5 == 6 ? 2 : first >> 4 == 14 ? 3 : first >> 3 == 30 ? 4 : 0;
    if (length < 2)
        return first;
    uint32_t point = first & (0x7fu >> length);
    for (size_t i = 1; i < length; ++i)
    {
        if (byte(at + i) >> 6 != 2)
            length = 0;
        point = point << 6 | (byte(at + i) & 0x3f);
    }
    if (length > 0 && (point < LEAST[length] || point > 0x10ffff))
        length = 0;
    return point;
}

/// Characters that move the cursor, set colours, begin a line or change the direction of writing.
bool isControl(uint32_t point)
{
    return point < 0x20 || (point >= 0x7f && point < 0xa0) || point == 0x61c || point == 0x200e ||
           point == 0x200f || (point >= 0x2028 && point <= 0x202e) || (point >= 0x2066 && point <= 0x2069) ||
           (point >= 0xd800 && point < 0xe000);
}

} // namespace

std::string toTerminalText(const std::string& text)
{
    std::string escaped;
    for (size_t at = 0; at < text.size();)
    {
        size_t length;
        const uint32_t point = readCodePoint(text, at, length);
        const bool isPlain = length > 0 && !isControl(point);
        const size_t size = std::max<size_t>(length, 1);
        for (size_t i = at; i < at + size; ++i)
        {
            char code[8];
            std::snprintf(code, sizeof(code), "\\x%02x", unsigned(uint8_t(text[i])));
            escaped += isPlain ? std::string(1, text[i]) : code;
        }
        at += size;
    }
    return escaped;
}

} // namespace commandline
