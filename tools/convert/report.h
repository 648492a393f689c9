#pragma once

#include <cstdint>
#include <map>
#include <string>
#include <utility>
#include <vector>

namespace convert
{

/// The report on a conversion: figures, and sentences about approximated and lost features.
///
/// Codes and names of figures are for scripts and do not change; docs/convert.md lists them. Lower case, words joined
/// by '-'.
class Report
{
public:
    /// A code and a sentence, such as "node-shear" and "the shear of node \"arm\"".
    using Finding = std::pair<std::string, std::string>;

    /// A name in the plural, such as "vertices".
    using Figures = std::vector<std::pair<std::string, uint64_t>>;

    /// A feature that the scene lacks. Repetitions are only counted.
    void lose(const std::string& code, const std::string& sentence) { ++m_losses[{code, sentence}]; }
    /// A feature that the scene has in another form, which looks slightly different.
    void approximate(const std::string& code, const std::string& sentence)
    {
        ++m_approximations[{code, sentence}];
    }
    /// Adds to a figure of the conversion, such as "degenerate-faces"; one that is 0 is reported too.
    void count(const std::string& figure, uint64_t number) { m_figures[figure] += number; }
    /// Counts of the model and of the scene, in the order of the calls.
    void cameIn(const std::string& figure, uint64_t number) { m_in.emplace_back(figure, number); }
    void wentOut(const std::string& figure, uint64_t number) { m_out.emplace_back(figure, number); }
    /// The format's name.
    void setFormat(const std::string& name) { m_format = name; }

    /// The number of occurrences of each.
    const std::map<Finding, int>& getLosses() const { return m_losses; }
    const std::map<Finding, int>& getApproximations() const { return m_approximations; }
    const std::map<std::string, uint64_t>& getFigures() const { return m_figures; }
    const Figures& getIn() const { return m_in; }
    const Figures& getOut() const { return m_out; }
    const std::string& getFormat() const { return m_format; }

private:
    std::map<Finding, int> m_losses;
    std::map<Finding, int> m_approximations;
    std::map<std::string, uint64_t> m_figures;
    Figures m_in;
    Figures m_out;
    std::string m_format;
};

} // namespace convert
