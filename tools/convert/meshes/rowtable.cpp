#include "rowtable.h"

#include <cstring>
#include <limits>
#include <utility>

namespace convert
{

namespace
{

constexpr uint32_t EMPTY = std::numeric_limits<uint32_t>::max();

uint64_t hash(const float* row, size_t width)
{
    uint64_t hash = 0;
    for (size_t i = 0; i < width; ++i)
    {
        uint32_t bits;
        std::memcpy(&bits, &row[i], sizeof(bits));
        hash = (hash ^ bits) * 0x9e3779b97f4a7c15u;
        hash ^= hash >> 32;
    }
    return hash;
}

} // namespace

RowTable::RowTable(size_t width, size_t expected) : m_width(width)
{
    m_values.reserve(width * expected);
    m_slots.resize(64, EMPTY);
}

/// That of an equal row, or the one where it is to be.
size_t RowTable::findSlot(const float* row) const
{
    const size_t last = m_slots.size() - 1;
    size_t slot = hash(row, m_width) & last;
    while (m_slots[slot] != EMPTY && std::memcmp((*this)[m_slots[slot]], row, m_width * sizeof(float)) != 0)
        slot = (slot + 1) & last;
    return slot;
}

uint32_t RowTable::add(const float* row)
{
    const size_t slot = findSlot(row);
    if (m_slots[slot] != EMPTY)
        return m_slots[slot];
    m_values.insert(m_values.end(), row, row + m_width);
    m_slots[slot] = uint32_t(m_count++);
    if (m_count * 2 > m_slots.size())
        grow();
    return uint32_t(m_count - 1);
}

void RowTable::grow()
{
    const std::vector<uint32_t> old =
        std::exchange(m_slots, std::vector<uint32_t>(m_slots.size() * 2, EMPTY));
    for (const uint32_t number : old)
    {
        if (number != EMPTY)
            m_slots[findSlot((*this)[number])] = number;
    }
}

} // namespace convert
