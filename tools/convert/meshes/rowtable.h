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
    /// Of a row; the hash tells most others from it without a look at them.
    struct Slot
    {
        uint32_t number;
        uint32_t hash;
    };

    size_t findSlot(const float* row, uint32_t hash) const;
    void grow();

    size_t m_width;
    size_t m_count = 0;
    std::vector<float> m_values;
    std::vector<Slot> m_slots; ///< of rows, from where their hashes point on; a power of two
};

} // namespace convert
