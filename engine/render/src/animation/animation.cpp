#include "orv/animation.h"

#include "orv/log.h"

#include "smoothmotion.h"

#include <cmath>

// Everything that moves along an animation's time line; log records name this file for loopSize's assertion.

namespace orv
{

namespace
{

/// Whole loops subtracted one by one. Beyond that the remainder is computed directly, so that a tiny loop or a huge
/// step does not delay the frame.
constexpr int MAX_SINGLE_LOOPS = 16;

/// @param next  at or after loopEnd.
/// @return the same point of the loop, in [loopStart, loopEnd).
float wrapForwards(double next, float loopStart, float loopEnd)
{
    const double size = double(loopEnd) - double(loopStart);
    const float wrapped = float(loopStart + std::fmod(next - loopStart, size));
    return wrapped < loopEnd ? wrapped : loopStart;
}

/// @param next  at or before loopStart.
/// @return the same point of the loop, in (loopStart, loopEnd].
float wrapBackwards(double next, float loopStart, float loopEnd)
{
    const double size = double(loopEnd) - double(loopStart);
    const float wrapped = float(loopEnd - std::fmod(loopEnd - next, size));
    return wrapped > loopStart ? wrapped : loopEnd;
}

/// 0 for a range that is reversed or begins and ends at the same infinity.
float getDistance(float start, float end)
{
    return end > start ? end - start : 0.0f;
}

} // namespace

float getLength(const Animation& animation)
{
    return getDistance(animation.getStart(), animation.getEnd());
}

AnimationController::AnimationController(const Animation::Ptr& animation)
    : m_start(animation ? animation->getStart() : 0.0f)
    , m_end(animation ? animation->getEnd() : 0.0f)
    , m_animation(animation)
{
}

AnimationController::~AnimationController() = default;

void AnimationController::update(float deltaTime)
{
    if (!m_enabled)
        return;
    // What is applied may drop this controller, or give it something else to play.
    const SharedPtr<AnimationController> self(sharedGetCount() > 0 ? this : nullptr);
    move(deltaTime);
    if (m_smooth)
        applySmoothly(deltaTime);
    else if (const Animation::Ptr animation = m_animation)
        animation->apply(m_progress);
}

void AnimationController::move(float deltaTime)
{
    m_progress = clampToRange(m_progress);
    const float step = deltaTime * m_speed;
    if (!m_paused && !std::isnan(step))
        m_progress = clampToRange(advance(step));
}

float AnimationController::clampToRange(float progress) const
{
    if (!(progress > m_start)) // also for NaN
        return m_start;
    return m_end <= progress ? m_end : progress;
}

/// @return the progress after a step, not yet clamped. In a loop, an infinite step changes nothing.
float AnimationController::advance(float step) const
{
    float next = m_progress + step;
    if (!m_looping || !(m_loopStart < m_loopEnd))
        return next;
    if (!std::isfinite(step))
        return m_progress;

    const float loopSize = m_loopEnd - m_loopStart;
    ORV_ASSERT(loopSize > 0.0f);
    if (!(loopSize > 0.0f) || !std::isfinite(loopSize))
        return next;

    if (step > 0.0f && m_progress <= m_loopEnd)
    {
        for (int i = 0; i < MAX_SINGLE_LOOPS && next >= m_loopEnd; ++i)
            next -= loopSize;
        if (next >= m_loopEnd)
            next = wrapForwards(double(m_progress) + double(step), m_loopStart, m_loopEnd);
    }
    else if (step < 0.0f && m_progress >= m_loopStart)
    {
        for (int i = 0; i < MAX_SINGLE_LOOPS && next <= m_loopStart; ++i)
            next += loopSize;
        if (next <= m_loopStart)
            next = wrapBackwards(double(m_progress) + double(step), m_loopStart, m_loopEnd);
    }
    return next;
}

void play(AnimationController& controller, bool update)
{
    controller.setEnabled(true);
    controller.setPaused(false);
    if (isFinished(controller))
        rewind(controller, update);
    else if (update)
        controller.update(0.0f);
}

void pause(AnimationController& controller, bool update)
{
    controller.setPaused(true);
    if (update)
        controller.update(0.0f);
}

void stop(AnimationController& controller, bool update)
{
    controller.endFades();
    controller.setEnabled(true);
    rewind(controller, update);
    controller.setEnabled(false);
}

void rewind(AnimationController& controller, bool update)
{
    if (controller.getSpeed() > 0.0f)
        controller.setProgress(controller.getStart());
    else if (controller.getSpeed() < 0.0f)
        controller.setProgress(controller.getEnd());
    if (update)
        controller.update(0.0f);
}

void seek(AnimationController& controller, float progress)
{
    controller.setProgress(progress);
    controller.update(0.0f);
}

void setRange(AnimationController& controller, float start, float end)
{
    controller.setStart(start);
    controller.setEnd(end);
}

void setLoopRange(AnimationController& controller, float start, float end)
{
    controller.setLoopStart(start);
    controller.setLoopEnd(end);
}

float getLength(const AnimationController& controller)
{
    return getDistance(controller.getStart(), controller.getEnd());
}

float getLoopLength(const AnimationController& controller)
{
    return getDistance(controller.getLoopStart(), controller.getLoopEnd());
}

bool hasLoop(const AnimationController& controller)
{
    return controller.getLoopStart() < controller.getLoopEnd();
}

bool isInsideLoop(const AnimationController& controller)
{
    return hasLoop(controller) && controller.isLooping() &&
           controller.getLoopStart() <= controller.getProgress() &&
           controller.getProgress() <= controller.getLoopEnd();
}

bool isFinished(const AnimationController& controller)
{
    if (isInsideLoop(controller))
        return false;
    if (controller.getSpeed() > 0.0f)
        return controller.getProgress() >= controller.getEnd();
    if (controller.getSpeed() < 0.0f)
        return controller.getProgress() <= controller.getStart();
    return false;
}

} // namespace orv
