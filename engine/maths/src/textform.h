#pragma once

#include <locale>
#include <sstream>
#include <string>

namespace orv::detail
{

/// "name(first, second, ...)", numbers as a default stream prints them, whatever locale the program has set.
template <class First, class... Others>
std::string textForm(const char* name, const First& first, const Others&... others)
{
    std::ostringstream text;
    text.imbue(std::locale::classic());
    text << name << '(' << first;
    ((text << ", " << others), ...);
    text << ')';
    return text.str();
}

} // namespace orv::detail
