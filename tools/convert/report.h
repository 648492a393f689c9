#pragma once

#include <cstdint>
#include <map>
#include <string>

namespace convert
{

/// What became of a model: figures, and in sentences for a person what could not be carried over as it was.
class Report
{
public:
    /// The same again is only counted.
    void lose(const std::string& what) { ++m_losses[what]; }
    void approximate(const std::string& what) { ++m_approximations[what]; }
    /// Adds to a figure, such as "degenerate faces dropped".
    void count(const std::string& figure, uint64_t number) { m_figures[figure] += number; }

    /// By sentence, how often.
    const std::map<std::string, int>& getLosses() const { return m_losses; }
    const std::map<std::string, int>& getApproximations() const { return m_approximations; }
    const std::map<std::string, uint64_t>& getFigures() const { return m_figures; }

private:
    std::map<std::string, int> m_losses;
    std::map<std::string, int> m_approximations;
    std::map<std::string, uint64_t> m_figures;
};

} // namespace convert
