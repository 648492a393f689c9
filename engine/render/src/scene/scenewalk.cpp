#include "scenewalk.h"

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

} // namespace orv::detail
