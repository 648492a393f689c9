#include "orv/detail/childlist.h"

#include "orv/scenenode.h"

#include <algorithm>
#include <utility>

namespace orv::detail
{

ChildList::Cursor::Cursor(ChildList& list)
    : m_list(list)
    , m_end(list.m_places.size())
    , m_outer(std::exchange(list.m_cursors, this))
{
}

ChildList::Cursor::~Cursor()
{
    m_list.m_cursors = m_outer;
}

const SharedPtr<SceneNode>& ChildList::get(uint32_t i)
{
    if (m_first + m_count != m_places.size())
        closeGaps();
    return m_places[m_first + i];
}

const std::vector<SharedPtr<SceneNode>>& ChildList::getAll()
{
    if (m_count != m_places.size())
        closeGaps();
    return m_places;
}

void ChildList::add(SceneNode& child)
{
    child.m_place = uint32_t(m_places.size());
    m_places.emplace_back(&child);
    ++m_count;
}

SharedPtr<SceneNode> ChildList::take(const SceneNode& child)
{
    SharedPtr<SceneNode> taken = std::move(m_places[child.m_place]);
    --m_count;
    while (m_first < m_places.size() && !m_places[m_first])
        ++m_first;
    if (m_places.size() - m_count > m_count)
        closeGaps();
    return taken;
}

/// The count of children at places before this one.
size_t ChildList::countBefore(size_t place) const
{
    const auto isChild = [](const SharedPtr<SceneNode>& held) { return bool(held); };
    return size_t(std::count_if(m_places.begin(), m_places.begin() + ptrdiff_t(place), isChild));
}

void ChildList::closeGaps()
{
    for (Cursor* cursor = m_cursors; cursor; cursor = cursor->m_outer)
    {
        cursor->m_place = countBefore(cursor->m_place);
        cursor->m_end = countBefore(cursor->m_end);
    }
    uint32_t next = 0;
    for (SharedPtr<SceneNode>& held : m_places)
    {
        if (!held)
            continue;
        held->m_place = next;
        m_places[next++].swap(held);
    }
    m_places.resize(next);
    m_first = 0;
}

} // namespace orv::detail
