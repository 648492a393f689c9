#include "textform.h"

#include <locale>
#include <sstream>

namespace orv::detail
{

namespace
{

template <class Number>
std::string listNumbers(const char* name, std::initializer_list<Number> values)
{
    std::ostringstream text;
    text.imbue(std::locale::classic());
    const char* separator = "(";
    text << name;
    for (const Number value : values)
    {
        text << separator << value;
        separator = ", ";
    }
    text << ')';
    return text.str();
}

} // namespace

std::string textForm(const char* name, std::initializer_list<float> values)
{
    return listNumbers(name, values);
}

std::string textForm(const char* name, std::initializer_list<int> values)
{
    return listNumbers(name, values);
}

} // namespace orv::detail
