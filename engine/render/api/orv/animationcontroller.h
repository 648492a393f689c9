#pragma once

#include "orv/animation.h"
#include "orv/export.h"

#include <memory>

namespace orv
{

class SceneNode;

/// Plays an animation: where it stands, how fast it goes, what it repeats. All times are seconds on the
/// animation's time line; setters store what they are given.
///
/// Smooth motion, all of it off until asked for: values between keys are interpolated (setInterpolated()), clips
/// cross-fade (fadeTo()), a controller plays on one part of the figure (setSubtree()), or over what other controllers play
/// (fadeWeight()). Of several controllers that move the same things, the one that is updated later lies over the others.
///
///     AnimationController walk(model->getAnimation("walk"));    // update this one first
///     AnimationController wave(model->getAnimation("wave"));
///     wave.setSubtree(arm);                                     // walks with the legs, waves with the arm
///     wave.setWeight(0.0f);
///     wave.fadeWeight(1.0f, 0.2f);                              // begins to wave within a fifth of a second
class ORV_API AnimationController : public Shared
{
public:
    ORV_CLASS_NAME("AnimationController")
    using Ptr = SharedPtr<AnimationController>;

    /// Enabled, playing, looping without a loop range, at speed 1 and progress 0, over the animation's whole
    /// range.
    /// @param animation  shared; an empty one has the range 0 to 0 and is never applied.
    explicit AnimationController(const Animation::Ptr& animation);
    ~AnimationController() override;

    /// Advances by deltaTime * speed unless paused, and applies the animation, also when paused. Does nothing
    /// at all while disabled. An animator of your own may give this controller something else to play, or drop it.
    ///
    /// Progress is clamped to the range. While looping with loopStart < loopEnd, playing forwards from at or
    /// before loopEnd wraps from loopEnd to loopStart, and playing backwards from at or after loopStart wraps
    /// from loopStart to loopEnd; the end point reached is never shown. A step that is not finite moves
    /// nothing.
    /// @param deltaTime  seconds since the last call.
    void update(float deltaTime);

    const Animation::Ptr& getAnimation() const { return m_animation; } ///< What it plays; may be empty.

    /// While disabled or paused, update() changes nothing; looping is on or off.
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

    /// The part that is played, and the part of it that a loop repeats, in seconds.
    float getStart() const { return m_start; }
    void setStart(float start) { m_start = start; }
    float getEnd() const { return m_end; }
    void setEnd(float end) { m_end = end; }
    float getLoopStart() const { return m_loopStart; }
    void setLoopStart(float loopStart) { m_loopStart = loopStart; }
    float getLoopEnd() const { return m_loopEnd; }
    void setLoopEnd(float loopEnd) { m_loopEnd = loopEnd; }

    /// Whether values between two keys lie between the keys' values: numbers, vectors and colours straight, rotations
    /// turned the short way round at constant speed (slerp()). Without it (at first) each key's value holds until the next
    /// one's time; channels whose file asks for it are interpolated always.
    ///
    /// Nothing is made up: before the first key and after the last one their values hold, and from the end of a loop to its
    /// start it is a jump, as it is without, so give a cycle the same value at both. Tracks are independent of each other's
    /// key times. Between keys of the same time, or where one of two keys is not finite, values step. Keys must
    /// be made for it: a file for stepping may lack those of values that stay as they are for a while.
    bool isInterpolated() const;
    void setInterpolated(bool interpolated);

    /// The node to which playing is limited, with everything below it; empty (at first) for no limit. Who is below is
    /// asked at each update. Materials are in no subtree and are left alone.
    SharedPtr<SceneNode> getSubtree() const;
    void setSubtree(const SharedPtr<SceneNode>& top);

    /// How far targets go from what they have otherwise (0) to what the animation has (1, at first). At 0 nothing is
    /// written, and time goes on.
    ///
    /// What they have otherwise is what somebody else wrote since this controller's last update, or else what they had
    /// before it first mixed; so a controller that is to come and go begins with setWeight(0). Of several controllers
    /// that move the same things the lowest needs the weight 1: below it is only what the ones above it wrote last time.
    float getWeight() const;
    /// At once; a fade of the weight ends. @param weight  clamped to 0 to 1, not a number counts as 0.
    void setWeight(float weight);
    /// Evenly, from the weight of the moment, which may be on its way elsewhere.
    /// @param seconds  as update() counts them, whatever the speed, and none while paused; at once unless it is
    /// a number above 0.
    void fadeWeight(float weight, float seconds);

    /// Plays something else from its start (from its end with a negative speed), as range and loop range, while what was
    /// played before plays on and fades away under it. Speed, pause, looping and subtree stay as they are.
    ///
    /// A fade may begin during a fade: all of them go on, so that nothing jumps, up to four clips at a time; beyond those
    /// the one that shows least is let go. What only the old clip moves stays where it is when the fade ends. Animations are
    /// shared for as long as they can be seen; a controller that dies in a fade leaves everything as it stands.
    /// @param animation  what getAnimation() is from now on; the one before may be given again, for another clip of it.
    /// @param seconds    as for fadeWeight().
    void fadeTo(const Animation::Ptr& animation, float start, float end, float seconds);
    /// The same within the animation that is played.
    void fadeTo(float start, float end, float seconds) { fadeTo(m_animation, start, end, seconds); }

    bool isFading() const; ///< clips or the weight
    /// All fades are over: the last clip alone, at the weight that it was to have. stop() does this first.
    void endFades();

private:
    struct ORV_LOCAL Smooth;

    ORV_LOCAL void move(float deltaTime);
    ORV_LOCAL void applySmoothly(float deltaTime);
    ORV_LOCAL Smooth& smooth();
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
    std::unique_ptr<Smooth> m_smooth; ///< null until something of it is asked for
};

/// In all of these `update` applies the new state at once, by controller.update(0).

/// Enables and resumes; a finished animation starts over (see rewind()).
ORV_API void play(AnimationController& controller, bool update);
ORV_API void pause(AnimationController& controller, bool update);
/// Ends fades, rewinds, applies the rewound state if update is true, and disables.
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
