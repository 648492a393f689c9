#pragma once

#include <initializer_list>
#include <string>

namespace orv::detail
{

/// "name(first, second, ...)", numbers as a default stream prints them, whatever locale the program has set.
std::string textForm(const char* name, std::initializer_list<float> values);
std::string textForm(const char* name, std::initializer_list<int> values);

} // namespace orv::detail
