#include "orv/animationgroup.h"

#include "orv/log.h"

#include <algorithm>

namespace orv
{

void AnimationGroup::addAnimation(const Animation::Ptr& animation)
{
    if (!animation)
    {
        ORV_LOG_ERROR("Cannot add an empty animation to a group.");
        return;
    }
    if (animation->contains(*this))
    {
        ORV_LOG_ERROR("Cannot add an animation to a group that it contains.");
        return;
    }
    m_animations.push_back(animation);
}

void AnimationGroup::addTimes(std::vector<float>& times) const
{
    for (const Animation::Ptr& animation : m_animations)
        animation->addTimes(times);
}

bool AnimationGroup::contains(const Animation& other) const
{
    for (const Animation::Ptr& animation : m_animations)
    {
        if (animation->contains(other))
            return true;
    }
    return this == &other;
}

Animation::Ptr AnimationGroup::getAnimation(int index) const
{
    if (index >= getAnimationCount())
    {
        ORV_LOG_ERROR("Index %d exceeds animation count %d.", index, getAnimationCount());
        return nullptr;
    }
    return m_animations[static_cast<size_t>(index)];
}

/// By index: what is applied may add animations, whose turn comes the next time.
void AnimationGroup::apply(float progress)
{
    for (size_t i = 0, count = m_animations.size(); i < count; ++i)
        m_animations[i]->apply(progress);
}

void AnimationGroup::applyMixed(float progress, const AnimationMix& mix)
{
    for (size_t i = 0, count = m_animations.size(); i < count; ++i)
        m_animations[i]->applyMixed(progress, mix);
}

float AnimationGroup::getStart() const
{
    if (m_animations.empty())
        return 0.0f;
    float start = m_animations.front()->getStart();
    for (const Animation::Ptr& animation : m_animations)
        start = std::min(start, animation->getStart());
    return start;
}

float AnimationGroup::getEnd() const
{
    if (m_animations.empty())
        return 0.0f;
    float end = m_animations.front()->getEnd();
    for (const Animation::Ptr& animation : m_animations)
        end = std::max(end, animation->getEnd());
    return end;
}

} // namespace orv
