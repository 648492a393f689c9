#pragma once

#include "orv/animationmix.h"
#include "orv/shared.h"
#include "orv/sharedptr.h"

namespace orv
{

/// Writes a value into one property of one object.
template <class T>
class Animator : public Shared
{
public:
    ORV_CLASS_NAME("Animator")
    using Ptr = SharedPtr<Animator<T>>;

    virtual void apply(const T& value) = 0; ///< Sets what it stands for to a value.

    /// Writes a value between those of two keys, for a controller with smooth motion. Without an override it writes with
    /// a weight of a half or more, and never for a subtree; the value is interpolated linearly (for types of your own it
    /// is the first one).
    /// @param share  0 to 1, from the first value to the second.
    virtual void applyMixed(const T& from, const T& to, float share, const AnimationMix& mix)
    {
        if (!mix.isMostly())
            return;
        if constexpr (requires { AnimationMix::between(from, to, share); })
            apply(AnimationMix::between(from, to, share));
        else
            apply(from);
    }
};

} // namespace orv
