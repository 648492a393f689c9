#pragma once

#include <algorithm>
#include <cctype>
#include <string>

namespace convert
{

/// ASCII letters alone.
inline std::string toLowerCase(std::string text)
{
    std::transform(text.begin(), text.end(), text.begin(),
                   [](unsigned char c) { return char(std::tolower(c)); });
    return text;
}

} // namespace convert
