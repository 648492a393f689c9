#pragma once

#include "orv/animatedvalue.h"
#include "orv/animation.h"
#include "orv/animator.h"

namespace orv
{

/// Couples a value with the animator that writes it. Both are shared.
///
/// A channel that lacks either logs an error each time it is needed and does nothing.
template <class T>
class AnimationChannel : public Animation
{
public:
    ORV_CLASS_NAME("AnimationChannel")
    using Ptr = SharedPtr<AnimationChannel<T>>;

    /// Hands a value over time to what it moves; both are shared.
    AnimationChannel(const typename AnimatedValue<T>::Ptr& value, const typename Animator<T>::Ptr& animator)
        : m_value(value)
        , m_animator(animator)
    {
    }

    void apply(float progress) override
    {
        Animator<T>* animator = m_animator.getLogged();
        const AnimatedValue<T>* value = m_value.getLogged();
        if (animator && value)
            animator->apply(value->getValue(progress));
    }

    void applyMixed(float progress, const AnimationMix& mix) override
    {
        Animator<T>* animator = m_animator.getLogged();
        const AnimatedValue<T>* value = m_value.getLogged();
        if (!animator || !value)
            return;
        T from, to;
        float share = 0.0f;
        if (mix.isInterpolated())
            share = value->getSpan(progress, from, to);
        else
            from = to = value->getValue(progress);
        animator->applyMixed(from, to, share, mix);
    }

    float getStart() const override
    {
        const AnimatedValue<T>* value = m_value.getLogged();
        return value ? value->getStart() : 0.0f;
    }

    float getEnd() const override
    {
        const AnimatedValue<T>* value = m_value.getLogged();
        return value ? value->getEnd() : 0.0f;
    }

    void addTimes(std::vector<float>& times) const override
    {
        if (m_value)
            m_value->addTimes(times);
    }

private:
    typename AnimatedValue<T>::Ptr m_value;
    typename Animator<T>::Ptr m_animator;
};

/// Makes a channel of the two.
template <class T>
typename AnimationChannel<T>::Ptr createAnimationChannel(const SharedPtr<AnimatedValue<T>>& value,
                                                         const SharedPtr<Animator<T>>& animator)
{
    return makeShared<AnimationChannel<T>>(value, animator);
}

} // namespace orv
