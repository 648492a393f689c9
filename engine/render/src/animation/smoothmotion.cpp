#include "smoothmotion.h"

#include <algorithm>
#include <cmath>

// Interpolation, fading and weights of AnimationController.

namespace orv
{

namespace
{

float clampWeight(float weight)
{
    return weight > 0.0f ? std::min(weight, 1.0f) : 0.0f; // also what is not a number
}

} // namespace

void AnimationController::Smooth::Ramp::begin(float seconds)
{
    const float newRate = 1.0f / seconds;
    const bool takesTime = seconds > 0.0f && newRate > 0.0f && std::isfinite(newRate);
    value = takesTime ? 0.0f : 1.0f;
    rate = takesTime ? newRate : 0.0f;
}

void AnimationController::Smooth::Ramp::advance(float seconds)
{
    if (!(rate > 0.0f))
        return;
    value += rate * seconds;
    if (value < 1.0f)
        return;
    value = 1.0f;
    rate = 0.0f;
}

void AnimationController::Smooth::advance(float deltaTime, bool isPaused)
{
    const float seconds = !isPaused && deltaTime > 0.0f ? deltaTime : 0.0f;
    weightRamp.advance(seconds);
    cover.advance(seconds);
    for (OldClip& old : oldClips)
    {
        old.player->setPaused(isPaused);
        old.player->move(deltaTime);
        old.cover.advance(seconds);
    }
    // Completely covered clips have no effect.
    size_t hidden = cover.rate > 0.0f ? 0 : oldClips.size();
    for (size_t i = 1; i < oldClips.size(); ++i)
        hidden = std::max(hidden, oldClips[i].cover.rate > 0.0f ? 0 : i);
    oldClips.erase(oldClips.begin(), oldClips.begin() + std::ptrdiff_t(hidden));
    if (oldClips.empty() && !isWeighted)
        places.clear(); // the current values are the base of the next fade
}

/// Each clip is blended over the older ones, so its weight is its part of the share that it has together with them.
void AnimationController::Smooth::findWeights()
{
    const float weight = getWeight();
    float newer = 0.0f; // the share of the clips above
    const auto take = [&](float covering)
    {
        const float share = covering * (1.0f - newer);
        const float rest = 1.0f - weight * newer;
        newer += share;
        return rest > 0.0f ? std::min(weight * share / rest, 1.0f) : 0.0f;
    };
    clipWeight = oldClips.empty() ? weight : take(cover.value);
    for (size_t i = oldClips.size(); i-- > 0;)
        oldClips[i].weight = take(i > 0 ? oldClips[i].cover.value : 1.0f);
}

/// Removes the clip with the least weight.
void AnimationController::Smooth::letGo()
{
    float newer = cover.value;
    size_t least = 0;
    float leastShare = 2.0f;
    for (size_t i = oldClips.size(); i-- > 0;)
    {
        const float share = (i > 0 ? oldClips[i].cover.value : 1.0f) * (1.0f - newer);
        newer += share;
        if (share < leastShare)
        {
            least = i;
            leastShare = share;
        }
    }
    oldClips.erase(oldClips.begin() + std::ptrdiff_t(least));
}

AnimationController::Smooth& AnimationController::smooth()
{
    if (!m_smooth)
        m_smooth = std::make_unique<Smooth>();
    return *m_smooth;
}

bool AnimationController::isInterpolated() const
{
    return m_smooth && m_smooth->isInterpolated;
}

void AnimationController::setInterpolated(bool interpolated)
{
    if (interpolated || m_smooth)
        smooth().isInterpolated = interpolated;
}

SharedPtr<SceneNode> AnimationController::getSubtree() const
{
    return m_smooth ? m_smooth->subtree : SharedPtr<SceneNode>();
}

void AnimationController::setSubtree(const SharedPtr<SceneNode>& top)
{
    if (top || m_smooth)
        smooth().subtree = top;
}

float AnimationController::getWeight() const
{
    return m_smooth ? m_smooth->getWeight() : 1.0f;
}

void AnimationController::setWeight(float weight)
{
    fadeWeight(weight, 0.0f);
}

void AnimationController::fadeWeight(float weight, float seconds)
{
    Smooth& s = smooth();
    if (!s.isWeighted)
        s.appliedWeight = 0.0f; // it blends with the current values
    s.isWeighted = true;
    s.startWeight = s.getWeight();
    s.endWeight = clampWeight(weight);
    s.weightRamp.begin(seconds);
}

void AnimationController::fadeTo(const Animation::Ptr& animation, float start, float end, float seconds)
{
    Smooth& s = smooth();
    if (seconds > 0.0f)
    {
        if (s.oldClips.size() == Smooth::MOST_OLD_CLIPS)
            s.letGo();
        const SharedPtr<AnimationController> old = makeShared<AnimationController>(m_animation);
        if (old)
        {
            old->m_looping = m_looping;
            old->m_speed = m_speed;
            old->m_progress = m_progress;
            setRange(*old, m_start, m_end);
            setLoopRange(*old, m_loopStart, m_loopEnd);
            s.oldClips.push_back({old, s.cover});
        }
    }
    s.cover.begin(seconds);
    m_animation = animation;
    setRange(*this, start, end);
    setLoopRange(*this, start, end);
    m_progress = m_speed < 0.0f ? end : start;
}

bool AnimationController::isFading() const
{
    return m_smooth && (m_smooth->weightRamp.rate > 0.0f || m_smooth->cover.rate > 0.0f);
}

void AnimationController::endFades()
{
    if (!m_smooth)
        return;
    m_smooth->weightRamp.begin(0.0f);
    m_smooth->cover.begin(0.0f);
}

void AnimationController::applySmoothly(float deltaTime)
{
    Smooth& s = *m_smooth;
    s.advance(deltaTime, m_paused);
    s.findWeights();
    const float weight = s.getWeight();
    const bool wasNothing = s.appliedWeight == 0.0f;
    s.appliedWeight = weight;
    if (wasNothing && weight == 0.0f)
        return;
    s.places.beginUpdate();
    detail::MixedPlaces* const places = s.isWeighted || !s.oldClips.empty() ? &s.places : nullptr;

    // Copies: what is applied may begin a fade, or set another subtree.
    struct Layer
    {
        Animation::Ptr animation;
        float progress = 0.0f;
        float weight = 0.0f;
    };
    Layer layers[Smooth::MOST_OLD_CLIPS + 1];
    Layer* end = layers;
    for (const Smooth::OldClip& old : s.oldClips)
        *end++ = {old.player->m_animation, old.player->m_progress, old.weight};
    *end++ = {m_animation, m_progress, s.clipWeight};
    const SharedPtr<SceneNode> subtree = s.subtree;
    const bool isInterpolated = s.isInterpolated;
    for (Layer* layer = layers; layer != end; ++layer)
    {
        if (layer->animation)
            layer->animation->applyMixed(layer->progress,
                                         AnimationMix(isInterpolated, layer->weight, subtree.get(), places));
    }
}

} // namespace orv
