#include "scenewalk.h"

#include <algorithm>

namespace orv::detail
{

namespace
{

thread_local SceneWalk* t_walk = nullptr;

} // namespace

SceneWalk::SceneWalk(SceneNode& top) : m_isOutermost(!t_walk)
{
    if (m_isOutermost)
        t_walk = this;
    if (top.sharedGetCount() > 0)
        m_top.reset(&top);
}

SceneWalk::~SceneWalk()
{
    if (m_isOutermost)
        t_walk = nullptr;
}

void SceneWalk::keep(const SharedPtr<SceneNode>& node)
{
    if (t_walk)
        t_walk->m_kept.push_back(node);
}

size_t findNextChild(const std::vector<SharedPtr<SceneNode>>& children, size_t place,
                     const SceneNode* visited)
{
    const auto end = children.begin() + ptrdiff_t(std::min(place, children.size()));
    const auto found = std::find(children.begin(), end, visited);
    return found == end ? place : size_t(found - children.begin()) + 1;
}

} // namespace orv::detail
