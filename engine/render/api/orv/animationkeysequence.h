#pragma once

#include "orv/animatedvalue.h"
#include "orv/colour.h"
#include "orv/vector.h"

#include <vector>

namespace orv
{

/// A value and the time, in seconds, from which it holds.
template <class T>
struct AnimationKey
{
    float time = 0.0f;
    T value = T();
};

/// Keyed values, stepped: each key's value holds until the next key's time, the first also before its own
/// time, the last ever after. Without keys the value is 0 in all components.
template <class T>
class AnimationKeySequence : public AnimatedValue<T>
{
public:
    ORV_CLASS_NAME("AnimationKeySequence")
    using Ptr = SharedPtr<AnimationKeySequence<T>>;

    AnimationKeySequence() = default;
    /// @param keys  in any order; sorted here (equal times in no guaranteed order). Keys whose time is not a
    /// number are left out with a warning.
    explicit AnimationKeySequence(std::vector<AnimationKey<T>> keys);

    /// The order in which keys are kept.
    static bool positionedBefore(const AnimationKey<T>& a, const AnimationKey<T>& b)
    {
        return a.time < b.time;
    }

    const std::vector<AnimationKey<T>>& getKeys() const { return m_keys; }

    T getValue(float time) const override;
    float getStart() const override; ///< the first key's time, 0 without keys
    float getEnd() const override;   ///< the last key's time, 0 without keys

private:
    std::vector<AnimationKey<T>> m_keys;
};

extern template class ORV_API AnimationKeySequence<float>;
extern template class ORV_API AnimationKeySequence<Vector3f>;
extern template class ORV_API AnimationKeySequence<Vector4f>;
extern template class ORV_API AnimationKeySequence<Colour4f>;

} // namespace orv
