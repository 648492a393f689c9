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

    void addAnimation(const Animation::Ptr& animation); ///< an empty one is refused with an error
    int getAnimationCount() const { return static_cast<int>(m_animations.size()); }
    /// @param index  not negative (unchecked).
    /// @return empty, after logging an error, for an index that is not below the count.
    Animation::Ptr getAnimation(int index) const;

    void apply(float progress) override;
    float getStart() const override; ///< the earliest of the members', 0 without members
    float getEnd() const override;   ///< the latest of the members', 0 without members

private:
    std::vector<Animation::Ptr> m_animations;
};

} // namespace orv
