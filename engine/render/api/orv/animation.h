#pragma once

#include "orv/animationmix.h"
#include "orv/shared.h"
#include "orv/sharedptr.h"

#include <vector>

namespace orv
{

/// Anything that can put itself into its state at a time. Times are seconds on the animation's own time line.
class ORV_API Animation : public Shared
{
public:
    ORV_CLASS_NAME("Animation")
    using Ptr = SharedPtr<Animation>;

    /// Puts what is animated to where it is at a moment, in seconds.
    virtual void apply(float progress) = 0;
    virtual float getStart() const = 0; ///< Where it begins and ends, in seconds.
    virtual float getEnd() const = 0;

    /// Adds the times at which what it applies changes, in any order; those at which it starts and ends unless it knows more.
    virtual void addTimes(std::vector<float>& times) const
    {
        times.insert(times.end(), {getStart(), getEnd()});
    }

    /// Whether applying this applies other: true for itself, for a group also for its members and their members. A class
    /// that holds animations has to override it.
    virtual bool contains(const Animation& other) const { return this == &other; }

    /// apply() for a controller with smooth motion. Without an override, the animation is applied with a weight of a half or
    /// more, and never for a subtree.
    virtual void applyMixed(float progress, const AnimationMix& mix)
    {
        if (mix.isMostly())
            apply(progress);
    }
};

/// End minus start, never below 0.
ORV_API float getLength(const Animation& animation);

} // namespace orv
