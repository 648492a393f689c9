#pragma once

#include "orv/animation.h"

#include <vector>

namespace orv
{

/// Animations applied together, in the order in which they were added. Members are shared.
class ORV_API AnimationGroup : public Animation
{
public:
    ORV_CLASS_NAME("AnimationGroup")
    using Ptr = SharedPtr<AnimationGroup>;

    /// Appends. Refused with an error is an empty one and one that contains this group, which would never be done.
    void addAnimation(const Animation::Ptr& animation);
    int getAnimationCount() const { return static_cast<int>(m_animations.size()); }
    /// @param index  not negative (unchecked).
    /// @return empty, after logging an error, for an index that is not below the count.
    Animation::Ptr getAnimation(int index) const;

    void apply(float progress) override;
    float getStart() const override; ///< the earliest of the members', 0 without members
    float getEnd() const override;   ///< the latest of the members', 0 without members
    void addTimes(std::vector<float>& times) const override;
    bool contains(const Animation& other) const override;
    void applyMixed(float progress, const AnimationMix& mix) override;

private:
    std::vector<Animation::Ptr> m_animations;
};

} // namespace orv
