#pragma once

#include "orv/animation.h"
#include "orv/export.h"

namespace orv
{

/// Plays an animation: where it stands, how fast it goes, what it repeats. All times are seconds on the
/// animation's time line; setters store what they are given.
class ORV_API AnimationController : public Shared
{
public:
    ORV_CLASS_NAME("AnimationController")
    using Ptr = SharedPtr<AnimationController>;

    /// Enabled, playing, looping without a loop range, at speed 1 and progress 0, over the animation's whole
    /// range.
    /// @param animation  shared; an empty one has the range 0 to 0 and is never applied.
    explicit AnimationController(const Animation::Ptr& animation);

    /// Advances by deltaTime * speed unless paused, and applies the animation, also when paused. Does nothing
    /// at all while disabled.
    ///
    /// Progress is clamped to the range. While looping with loopStart < loopEnd, playing forwards from at or
    /// before loopEnd wraps from loopEnd to loopStart, and playing backwards from at or after loopStart wraps
    /// from loopStart to loopEnd; the end point reached is never shown. A step that is not finite moves
    /// nothing.
    /// @param deltaTime  seconds since the last call.
    void update(float deltaTime);

    const Animation::Ptr& getAnimation() const { return m_animation; }

    bool isEnabled() const { return m_enabled; }
    void setEnabled(bool enabled) { m_enabled = enabled; }
    bool isPaused() const { return m_paused; }
    void setPaused(bool paused) { m_paused = paused; }
    bool isLooping() const { return m_looping; }
    void setLooping(bool looping) { m_looping = looping; }

    /// A factor on elapsed time; negative plays backwards.
    float getSpeed() const { return m_speed; }
    void setSpeed(float speed) { m_speed = speed; }
    float getProgress() const { return m_progress; }
    void setProgress(float progress) { m_progress = progress; }

    float getStart() const { return m_start; }
    void setStart(float start) { m_start = start; }
    float getEnd() const { return m_end; }
    void setEnd(float end) { m_end = end; }
    float getLoopStart() const { return m_loopStart; }
    void setLoopStart(float loopStart) { m_loopStart = loopStart; }
    float getLoopEnd() const { return m_loopEnd; }
    void setLoopEnd(float loopEnd) { m_loopEnd = loopEnd; }

private:
    ORV_LOCAL float clampToRange(float progress) const;
    ORV_LOCAL float advance(float step) const;

    bool m_enabled = true;
    bool m_paused = false;
    bool m_looping = true;
    float m_speed = 1.0f;
    float m_progress = 0.0f;
    float m_start = 0.0f;
    float m_end = 0.0f;
    float m_loopStart = 0.0f;
    float m_loopEnd = 0.0f;
    Animation::Ptr m_animation;
};

/// In all of these `update` applies the new state at once, by controller.update(0).

/// Enables and resumes; a finished animation starts over (see rewind()).
ORV_API void play(AnimationController& controller, bool update);
ORV_API void pause(AnimationController& controller, bool update);
/// Rewinds, applies the rewound state if update is true, and disables.
ORV_API void stop(AnimationController& controller, bool update);
/// Goes to the start, to the end when playing backwards, and nowhere at speed 0.
ORV_API void rewind(AnimationController& controller, bool update);
/// Goes to a time and applies it.
ORV_API void seek(AnimationController& controller, float progress);

/// Stored unchecked: a reversed range has length 0 and clamps progress to its start.
ORV_API void setRange(AnimationController& controller, float start, float end);
ORV_API void setLoopRange(AnimationController& controller, float start, float end);

ORV_API float getLength(const AnimationController& controller);     ///< never below 0
ORV_API float getLoopLength(const AnimationController& controller); ///< never below 0
ORV_API bool hasLoop(const AnimationController& controller);
/// Looping, with a loop range, and progress inside it (both ends count).
ORV_API bool isInsideLoop(const AnimationController& controller);
/// At the end in the direction of play; never at speed 0 nor inside a loop.
ORV_API bool isFinished(const AnimationController& controller);

} // namespace orv
