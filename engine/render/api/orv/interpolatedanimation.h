#pragma once

#include "orv/animation.h"

#include <vector>

namespace orv
{

/// Another animation, interpolated between its keys by every controller that plays it;
/// AnimationController::setInterpolated() has the rules.
class InterpolatedAnimation final : public Animation
{
public:
    ORV_CLASS_NAME("InterpolatedAnimation")
    using Ptr = SharedPtr<InterpolatedAnimation>;

    /// @param animation  shared; not empty.
    explicit InterpolatedAnimation(const Animation::Ptr& animation) : m_animation(animation) {}

    void apply(float progress) override { m_animation->applyMixed(progress, AnimationMix(true)); }
    void applyMixed(float progress, const AnimationMix& mix) override
    {
        m_animation->applyMixed(progress, mix.interpolated());
    }
    float getStart() const override { return m_animation->getStart(); }
    float getEnd() const override { return m_animation->getEnd(); }
    void addTimes(std::vector<float>& times) const override { m_animation->addTimes(times); }
    bool contains(const Animation& other) const override
    {
        return this == &other || m_animation->contains(other);
    }

private:
    Animation::Ptr m_animation;
};

} // namespace orv
