#pragma once

#include "orv/animatedvalue.h"
#include "orv/animationmix.h"
#include "orv/colour.h"
#include "orv/log.h"
#include "orv/vector.h"

#include <algorithm>
#include <cmath>
#include <iterator>
#include <utility>
#include <vector>

namespace orv
{

/// A value and the time, in seconds, from which it holds.
template <class T>
struct AnimationKey
{
    float time = 0.0f; ///< In seconds.
    T value = T();     ///< What it is then.
};

/// Keyed values, stepped: each key's value holds until the next key's time, the first also before its own
/// time, the last ever after. Without keys the value is 0 in all components. Of keys at one time the last holds; where
/// values are interpolated, the first one of them is what they go to, so two such keys are a jump.
template <class T>
class AnimationKeySequence : public AnimatedValue<T>
{
public:
    ORV_CLASS_NAME("AnimationKeySequence")
    using Ptr = SharedPtr<AnimationKeySequence<T>>;

    AnimationKeySequence() = default;
    /// @param keys  in any order; sorted here (equal times in no guaranteed order). Keys whose time is not a
    /// number are left out with a warning.
    explicit AnimationKeySequence(std::vector<AnimationKey<T>> keys) : m_keys(std::move(keys))
    {
        const auto isUnplaced = [](const AnimationKey<T>& key) { return std::isnan(key.time); };
        const auto unplaced = std::remove_if(m_keys.begin(), m_keys.end(), isUnplaced);
        if (unplaced != m_keys.end())
            ORV_LOG_WARN("Ignoring %d animation keys whose time is not a number.",
                         int(m_keys.end() - unplaced));
        m_keys.erase(unplaced, m_keys.end());
        if (std::is_sorted(m_keys.begin(), m_keys.end(), positionedBefore))
            return; // as a rule; so what follows may be slow but small, for it is there for each type
        std::make_heap(m_keys.begin(), m_keys.end(), positionedBefore);
        std::sort_heap(m_keys.begin(), m_keys.end(), positionedBefore);
    }

    /// The order in which keys are kept.
    static bool positionedBefore(const AnimationKey<T>& a, const AnimationKey<T>& b)
    {
        return a.time < b.time;
    }

    const std::vector<AnimationKey<T>>& getKeys() const { return m_keys; } ///< In the order of their times.

    T getValue(float time) const override
    {
        if (m_keys.empty())
            return T();
        const auto later = findLater(time);
        return later == m_keys.begin() ? later->value : std::prev(later)->value;
    }

    float getSpan(float time, T& from, T& to) const override
    {
        const auto later = findLater(time);
        if (later == m_keys.begin() || later == m_keys.end())
        {
            from = to = getValue(time);
            return 0.0f;
        }
        const AnimationKey<T>& earlier = *std::prev(later);
        from = earlier.value;
        to = later->value;
        return AnimationMix::getShare(earlier.time, later->time, time);
    }

    /// The first key's time, 0 without keys.
    float getStart() const override { return m_keys.empty() ? 0.0f : m_keys.front().time; }

    /// The last key's time, 0 without keys.
    float getEnd() const override { return m_keys.empty() ? 0.0f : m_keys.back().time; }

    void addTimes(std::vector<float>& times) const override
    {
        for (const AnimationKey<T>& key : m_keys)
            times.push_back(key.time);
    }

private:
    /// The first key after a time.
    typename std::vector<AnimationKey<T>>::const_iterator findLater(float time) const
    {
        return std::upper_bound(m_keys.begin(), m_keys.end(), time,
                                [](float t, const AnimationKey<T>& key) { return t < key.time; });
    }

    std::vector<AnimationKey<T>> m_keys;
};

} // namespace orv
