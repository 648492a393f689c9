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
    void clear() { m_end = m_begin; }

    [[gnu::always_inline]] void add(const T& item)
    {
        if (m_end == m_limit) [[unlikely]]
            return addGrowing(item);
        *m_end++ = item;
    }

    /// Whether add() has memory for one more.
    bool hasRoom() const { return m_end != m_limit; }

    /// @return where to write count more.
    T* extend(std::size_t count)
    {
        if (count > std::size_t(m_limit - m_end))
            grow(size() + count);
        m_end += count;
        return m_end - count;
    }

    std::size_t size() const { return std::size_t(m_end - m_begin); }
    T* begin() { return m_begin; }
    T* end() { return m_end; }
    T& operator[](std::size_t i) { return m_begin[i]; }

private:
    [[gnu::noinline]] void addGrowing(T item)
    {
        grow(size() + 1);
        *m_end++ = item;
    }

    [[gnu::noinline]] void grow(std::size_t needed)
    {
        const std::size_t count = size();
        m_memory.resize(std::max(needed, m_memory.size() + m_memory.size() / 2));
        m_begin = m_memory.data();
        m_end = m_begin + count;
        m_limit = m_begin + m_memory.size();
    }

    T* m_begin = nullptr; ///< m_memory's
    T* m_end = nullptr;
    T* m_limit = nullptr; ///< of the memory
    std::vector<T> m_memory;
};

} // namespace orv::detail
