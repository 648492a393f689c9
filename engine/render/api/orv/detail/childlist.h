#pragma once

#include "orv/sharedptr.h"

#include <cstddef>
#include <cstdint>
#include <vector>

namespace orv
{

class SceneNode;

namespace detail
{

/// The children of a node, in order. A child that is taken leaves a gap, and gaps are closed when there are more of them
/// than children or when they are in the way, so that taking all children one by one takes time in proportion.
class ChildList
{
public:
    /// A walk over the children that are there at first. In the course of it children may be added and taken.
    class Cursor
    {
    public:
        /// @param list  outlives the cursor; cursors of one list end in the reverse order of their beginnings.
        explicit Cursor(ChildList& list);
        ~Cursor();
        Cursor(const Cursor&) = delete;
        Cursor& operator=(const Cursor&) = delete;

        /// @return null after the last child.
        SceneNode* next()
        {
            while (m_place < m_end)
            {
                if (SceneNode* child = m_list.m_places[m_place++].get())
                    return child;
            }
            return nullptr;
        }

    private:
        friend class ChildList;

        ChildList& m_list;
        size_t m_place = 0;
        size_t m_end; ///< at most the count of places
        Cursor* m_outer;
    };

    uint32_t getCount() const { return m_count; }

    /// @param i  below getCount().
    const SharedPtr<SceneNode>& get(uint32_t i);
    const std::vector<SharedPtr<SceneNode>>& getAll();

    void add(SceneNode& child);
    /// @param child  one of these.
    /// @return the share that was held.
    SharedPtr<SceneNode> take(const SceneNode& child);

private:
    void closeGaps();
    size_t countBefore(size_t place) const;

    std::vector<SharedPtr<SceneNode>> m_places; ///< empty where there is a gap
    uint32_t m_first = 0;                       ///< places before the first child
    uint32_t m_count = 0;
    Cursor* m_cursors = nullptr; ///< the innermost
};

} // namespace detail
} // namespace orv
