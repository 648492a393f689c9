#include "orv/animationkeysequence.h"

#include "orv/log.h"

#include <algorithm>
#include <cmath>
#include <utility>

namespace orv
{

template <class T>
AnimationKeySequence<T>::AnimationKeySequence(std::vector<AnimationKey<T>> keys) : m_keys(std::move(keys))
{
    const auto isUnplaced = [](const AnimationKey<T>& key) { return std::isnan(key.time); };
    const auto unplaced = std::remove_if(m_keys.begin(), m_keys.end(), isUnplaced);
    if (unplaced != m_keys.end())
        ORV_LOG_WARN("Ignoring %d animation keys whose time is not a number.", int(m_keys.end() - unplaced));
    m_keys.erase(unplaced, m_keys.end());
    std::sort(m_keys.begin(), m_keys.end(), positionedBefore);
}

template <class T>
T AnimationKeySequence<T>::getValue(float time) const
{
    if (m_keys.empty())
        return T();
    const auto later = std::upper_bound(m_keys.begin(), m_keys.end(), time,
                                        [](float t, const AnimationKey<T>& key) { return t < key.time; });
    return later == m_keys.begin() ? later->value : std::prev(later)->value;
}

template <class T>
float AnimationKeySequence<T>::getStart() const
{
    return m_keys.empty() ? 0.0f : m_keys.front().time;
}

template <class T>
float AnimationKeySequence<T>::getEnd() const
{
    return m_keys.empty() ? 0.0f : m_keys.back().time;
}

template class AnimationKeySequence<float>;
template class AnimationKeySequence<Vector3f>;
template class AnimationKeySequence<Vector4f>;
template class AnimationKeySequence<Colour4f>;

} // namespace orv
