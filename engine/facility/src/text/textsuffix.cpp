#include "orv/textsuffix.h"

#include <algorithm>
#include <string_view>

namespace orv
{

namespace
{

/// ASCII lower case, independent of the locale.
char toLower(char c)
{
    return c >= 'A' && c <= 'Z' ? char(c - 'A' + 'a') : c;
}

template <class Equal>
bool endsWith(const char* text, const char* suffix, Equal equal)
{
    if (!text || !suffix)
        return false;
    const std::string_view whole(text);
    const std::string_view end(suffix);
    return end.size() <= whole.size() &&
           std::equal(end.begin(), end.end(), whole.end() - std::ptrdiff_t(end.size()), equal);
}

} // namespace

bool endsWith(const char* text, const char* suffix)
{
    return endsWith(text, suffix, [](char a, char b) { return a == b; });
}

bool endsWithI(const char* text, const char* suffix)
{
    return endsWith(text, suffix, [](char a, char b) { return toLower(a) == toLower(b); });
}

} // namespace orv
