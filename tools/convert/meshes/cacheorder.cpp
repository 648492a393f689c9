#include "cacheorder.h"

#include <algorithm>
#include <limits>
#include <utility>

namespace convert
{

namespace
{

constexpr uint32_t NONE = std::numeric_limits<uint32_t>::max();

/// Orders triangles for a GPU's vertex cache: all triangles around one vertex, then those around another vertex that is
/// still in the cache.
class FanOrder
{
public:
    explicit FanOrder(const Corners& corners) : m_corners(corners) {}

    Corners make()
    {
        findTriangles();
        m_isDone.resize(m_corners.size() / 3);
        m_stamps.resize(m_remaining.size());
        m_order.reserve(m_corners.size());
        for (uint32_t vertex = findAny(); vertex != NONE; vertex = findNext())
            takeFan(vertex);
        return std::move(m_order);
    }

private:
    static constexpr uint32_t CACHE_SIZE = 16; // vertices that even small GPUs keep

    /// For each vertex, the triangles that it is in.
    void findTriangles()
    {
        m_remaining.resize(countVertices(m_corners));
        for (const uint32_t vertex : m_corners)
            ++m_remaining[vertex];
        m_first.push_back(0);
        for (const uint32_t count : m_remaining)
            m_first.push_back(m_first.back() + count);
        m_triangles.resize(m_corners.size());
        std::vector<uint32_t> next(m_first.begin(), m_first.end() - 1);
        for (size_t i = 0; i < m_corners.size(); ++i)
            m_triangles[next[m_corners[i]]++] = uint32_t(i / 3);
    }

    void takeFan(uint32_t centre)
    {
        m_candidates.clear();
        for (uint32_t i = m_first[centre]; i < m_first[centre + 1]; ++i)
        {
            const size_t triangle = m_triangles[i];
            if (m_isDone[triangle])
                continue;
            m_isDone[triangle] = true;
            for (size_t corner = triangle * 3; corner < triangle * 3 + 3; ++corner)
                takeCorner(m_corners[corner]);
        }
    }

    void takeCorner(uint32_t vertex)
    {
        m_order.push_back(vertex);
        m_trail.push_back(vertex);
        m_candidates.push_back(vertex);
        --m_remaining[vertex];
        if (m_time - m_stamps[vertex] > CACHE_SIZE)
            m_stamps[vertex] = m_time++;
    }

    /// The vertex of the last fan that has been in the cache longest, if its own fan still fits.
    uint32_t findNext()
    {
        uint32_t best = NONE;
        uint32_t bestAge = 0;
        for (const uint32_t vertex : m_candidates)
        {
            if (m_remaining[vertex] == 0)
                continue;
            const uint32_t age = m_time - m_stamps[vertex];
            const uint32_t rank = age + 2 * m_remaining[vertex] <= CACHE_SIZE ? age : 0;
            if (best == NONE || rank > bestAge)
            {
                best = vertex;
                bestAge = rank;
            }
        }
        return best != NONE ? best : findAny();
    }

    /// The latest earlier vertex with triangles left, then any other.
    uint32_t findAny()
    {
        for (; !m_trail.empty(); m_trail.pop_back())
        {
            if (m_remaining[m_trail.back()] > 0)
                return m_trail.back();
        }
        for (; m_cursor < m_remaining.size(); ++m_cursor)
        {
            if (m_remaining[m_cursor] > 0)
                return m_cursor;
        }
        return NONE;
    }

    const Corners& m_corners;
    std::vector<uint32_t> m_remaining; ///< by vertex: triangles to come
    std::vector<uint32_t> m_first;     ///< by vertex: where its triangles begin
    std::vector<uint32_t> m_triangles;
    std::vector<bool> m_isDone;
    std::vector<uint32_t> m_stamps; ///< by vertex: when it came into the cache
    uint32_t m_time = CACHE_SIZE + 1;
    uint32_t m_cursor = 0;
    Corners m_trail;
    Corners m_candidates;
    Corners m_order;
};

} // namespace

uint32_t countVertices(const Corners& corners)
{
    return corners.empty() ? 0 : *std::max_element(corners.begin(), corners.end()) + 1;
}

Corners orderForCache(const Corners& corners)
{
    return FanOrder(corners).make();
}

} // namespace convert
