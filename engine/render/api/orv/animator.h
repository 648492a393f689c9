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

    /// Writes what lies share of the way between two keys' values, as a controller wants it that was asked for smooth
    /// motion. An animator that does not override this writes with a weight of a half or more, and not at all on a
    /// subtree; the value lies straight between the two (for types of your own, it is the first).
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
