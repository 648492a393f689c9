#pragma once

#include "orv/shared.h"
#include "orv/sharedptr.h"

#include <vector>

namespace orv
{

/// A value for every time. T is float, Vector3f, Vector4f or Colour4f.
template <class T>
class AnimatedValue : public Shared
{
public:
    ORV_CLASS_NAME("AnimatedValue")
    using Ptr = SharedPtr<AnimatedValue<T>>;

    virtual T getValue(float time) const = 0; ///< The value at a moment, in seconds.
    virtual float getStart() const = 0;       ///< When the first and the last key are, in seconds.
    virtual float getEnd() const = 0;

    /// The two values between which a time lies, for interpolation. A value that has no keys to lie between is both.
    /// @return how far it lies between them, 0 up to, without, 1.
    virtual float getSpan(float time, T& from, T& to) const
    {
        from = to = getValue(time);
        return 0.0f;
    }

    /// Adds the times at which the value changes; those at which it starts and ends unless it knows more.
    virtual void addTimes(std::vector<float>& times) const
    {
        times.insert(times.end(), {getStart(), getEnd()});
    }
};

} // namespace orv
