#pragma once

#include <cstddef>
#include <cstdint>
#include <vector>

namespace convert
{

/// Rows of floats, equal ones, bit by bit, only once.
class RowTable
{
public:
    /// @param width     floats of a row.
    /// @param expected  number of rows that are likely to come.
    RowTable(size_t width, size_t expected);

    /// @return the number of the row; of an equal one if there is.
    uint32_t add(const float* row);

    const float* operator[](uint32_t number) const { return &m_values[number * m_width]; }
    size_t size() const { return m_count; }

private:
    size_t findSlot(const float* row) const;
    void grow();

    size_t m_width;
    size_t m_count = 0;
    std::vector<float> m_values;
    std::vector<uint32_t> m_slots; ///< numbers of rows, from where their hashes point on; a power of two
};

} // namespace convert
