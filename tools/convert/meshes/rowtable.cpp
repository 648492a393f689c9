#include "rowtable.h"

#include <cstring>
#include <limits>
#include <utility>

namespace convert
{

namespace
{

constexpr uint32_t EMPTY = std::numeric_limits<uint32_t>::max();

uint32_t makeHash(const float* row, size_t width)
{
    uint64_t hash = 0;
    for (size_t i = 0; i < width; ++i)
    {
        uint32_t bits;
        std::memcpy(&bits, &row[i], sizeof(bits));
        hash = (hash ^ bits) * 0x9e3779b97f4a7c15u;
        hash ^= hash >> 32;
    }
    return uint32_t(hash);
}

} // namespace

RowTable::RowTable(size_t width, size_t expected) : m_width(width)
{
    size_t slots = 64;
    while (slots < 2 * expected)
        slots *= 2;
    m_values.reserve(width * expected);
    m_slots.resize(slots, {EMPTY, 0});
}

/// The slot of an equal row, or the free slot for it.
size_t RowTable::findSlot(const float* row, uint32_t hash) const
{
    const size_t last = m_slots.size() - 1;
    size_t at = hash & last;
    for (; m_slots[at].number != EMPTY; at = (at + 1) & last)
    {
        const Slot& slot = m_slots[at];
        if (slot.hash == hash && std::memcmp((*this)[slot.number], row, m_width * sizeof(float)) == 0)
            break;
    }
    return at;
}

uint32_t RowTable::add(const float* row)
{
    const uint32_t hash = makeHash(row, m_width);
    Slot& slot = m_slots[findSlot(row, hash)];
    if (slot.number != EMPTY)
        return slot.number;
    m_values.insert(m_values.end(), row, row + m_width);
    slot = {uint32_t(m_count++), hash};
    if (m_count * 2 > m_slots.size())
        grow();
    return uint32_t(m_count - 1);
}

void RowTable::grow()
{
    const std::vector<Slot> old =
        std::exchange(m_slots, std::vector<Slot>(m_slots.size() * 2, Slot{EMPTY, 0}));
    const size_t last = m_slots.size() - 1;
    for (const Slot& slot : old)
    {
        size_t at = slot.hash & last;
        while (slot.number != EMPTY && m_slots[at].number != EMPTY)
            at = (at + 1) & last;
        if (slot.number != EMPTY)
            m_slots[at] = slot;
    }
}

} // namespace convert
