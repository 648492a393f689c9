#pragma once

#include <cstddef>
#include <cstdint>
#include <vector>

namespace convert
{

/// Unique rows of floats, compared bit by bit.
class RowTable
{
public:
    /// @param width     floats of a row.
    /// @param expected  likely number of rows.
    RowTable(size_t width, size_t expected);

    /// @return the number of the row, or of an equal one.
    uint32_t add(const float* row);

    const float* operator[](uint32_t number) const { return &m_values[number * m_width]; }
    size_t size() const { return m_count; }

private:
    /// The slot of a row, with its hash to avoid most comparisons.
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
    std::vector<Slot> m_slots; ///< open addressing by hash; its size is a power of two
};

} // namespace convert
