#pragma once

#include <cstddef>
#include <string_view>

namespace orv::detail
{

/// Takes one code point off the start of a text that is not empty.
/// @return -1 for what is not UTF-8, of which as much goes as could have been the start of a code point.
inline int readCodePoint(std::string_view& text)
{
    const auto first = static_cast<unsigned char>(text.front());
    text.remove_prefix(1);
    if (first < 0x80)
        return first;
    if (first < 0xC2 || first > 0xF4) // followers, longer forms of ASCII, beyond the last code point
        return -1;

    const int followers = first < 0xE0 ? 1 : (first < 0xF0 ? 2 : 3);
    int code = first & (0x3F >> followers);
    for (int i = 0; i < followers; ++i)
    {
        const int next = text.empty() ? 0 : static_cast<unsigned char>(text.front());
        // The first follower also tells longer forms, surrogates and what is beyond the last code point.
        const int least = i > 0 ? 0x80 : (first == 0xE0 ? 0xA0 : (first == 0xF0 ? 0x90 : 0x80));
        const int most = i > 0 ? 0xBF : (first == 0xED ? 0x9F : (first == 0xF4 ? 0x8F : 0xBF));
        if (next < least || next > most)
            return -1;
        code = code << 6 | (next & 0x3F);
        text.remove_prefix(1);
    }
    return code;
}

/// What draws nothing: negative, and control characters, for some of which fonts have a glyph.
inline bool isControl(int c)
{
    return c < 0x20 || (c >= 0x7F && c < 0xA0);
}

/// Calls use(line) for every line, the empty one after a last "\n" included.
template <class Use>
void forEachLine(std::string_view text, const Use& use)
{
    while (true)
    {
        const std::size_t end = text.find('\n');
        use(text.substr(0, end));
        if (end == std::string_view::npos)
            return;
        text.remove_prefix(end + 1);
    }
}

} // namespace orv::detail
