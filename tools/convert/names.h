#pragma once

#include <map>
#include <set>
#include <string>

namespace convert
{

/// Makes unique names that a scene file can hold.
class NameMaker
{
public:
    /// @param wanted    the model's name; used if it is free.
    /// @param fallback  for an empty one.
    std::string make(const std::string& wanted, const std::string& fallback)
    {
        constexpr size_t LONGEST = 1000; // of 1023, with room for a number
        const std::string stem = wanted.empty() ? fallback : wanted.substr(0, LONGEST);
        std::string name = stem;
        int& number = m_next.try_emplace(stem, 2).first->second; // thousands of nodes may have one name
        while (!m_taken.insert(name).second)
            name = stem + " " + std::to_string(number++);
        return name;
    }

private:
    std::set<std::string> m_taken;
    std::map<std::string, int> m_next; ///< by name without a number
};

} // namespace convert
