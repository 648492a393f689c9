#pragma once

#include <algorithm>
#include <cstddef>
#include <vector>

namespace orv::detail
{

/// A list that is filled again in each frame: adding costs next to nothing, and memory is kept. Of plain values.
template <class T>
class FrameList
{
public:
    void clear() { m_count = 0; }

    [[gnu::always_inline]] void add(const T& item)
    {
        if (m_count == m_room) [[unlikely]]
            return addGrowing(item);
        m_items[m_count++] = item;
    }

    /// Whether add() has memory for one more.
    bool hasRoom() const { return m_count != m_room; }

    /// @return where to write count more.
    T* extend(std::size_t count)
    {
        if (m_count + count > m_room)
            grow(m_count + count);
        m_count += count;
        return end() - count;
    }

    std::size_t size() const { return m_count; }
    T* begin() { return m_items; }
    T* end() { return m_items + m_count; }
    T& operator[](std::size_t i) { return m_items[i]; }

private:
    [[gnu::noinline]] void addGrowing(T item)
    {
        grow(m_count + 1);
        m_items[m_count++] = item;
    }

    [[gnu::noinline]] void grow(std::size_t needed)
    {
        m_memory.resize(std::max(needed, m_room + m_room / 2));
        m_items = m_memory.data();
        m_room = m_memory.size();
    }

    T* m_items = nullptr; ///< m_memory's
    std::size_t m_count = 0;
    std::size_t m_room = 0;
    std::vector<T> m_memory;
};

} // namespace orv::detail
