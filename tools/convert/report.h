#pragma once

#include <map>
#include <string>

namespace convert
{

/// What a conversion could not carry over, in sentences for a person.
class Report
{
public:
    /// The same loss again is only counted.
    void lose(const std::string& what) { ++m_losses[what]; }

    /// By sentence, how often.
    const std::map<std::string, int>& getLosses() const { return m_losses; }

private:
    std::map<std::string, int> m_losses;
};

} // namespace convert
