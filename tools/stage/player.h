#pragma once

#include "orv/animationcontroller.h"

#include <string>
#include <vector>

namespace view
{

/// A named part of the time line.
struct Clip
{
    std::string name;
    float start = 0.0f; ///< seconds
    float end = 0.0f;
};

/// A clip for an animation. If its times are infinite, the clip has no length: no player could go through it.
Clip makeClip(const std::string& name, const orv::Animation& animation);

/// Plays a time line, or one clip of it. Plays in a loop at first.
class Player
{
public:
    /// @param clips  the first is the whole time line; there is at least that one.
    Player(const orv::SharedPtr<orv::Animation>& animation, std::vector<Clip> clips);

    /// Continues at another player's clip and time, if this one has the clip: for a scene that was loaded again.
    void continueFrom(const Player& other);

    const std::vector<Clip>& getClips() const { return m_clips; }
    const Clip& getClip() const { return m_clips[m_clip]; }

    /// @return false, with nothing changed, if there is no clip of that name; error then lists the clips.
    bool chooseClip(const std::string& name);
    bool chooseClip(const std::string& name, std::string& error);
    /// Goes forward by a number of clips, cyclically, to the start of that clip.
    void stepClip(int count);

    float getTime() const { return m_controller.getProgress(); } ///< seconds
    float getShare() const;                                      ///< elapsed part of the clip, 0 to 1
    bool isPaused() const { return m_controller.isPaused(); }
    bool isLooping() const { return m_controller.isLooping(); }
    float getSpeed() const { return m_controller.getSpeed(); }
    bool isMoving() const; ///< update() will show something else

    void update(float seconds); ///< since the last call
    void setPaused(bool paused);
    void setLooping(bool looping) { m_controller.setLooping(looping); }
    void togglePaused(); ///< at the end without looping: starts again
    void scaleSpeed(float factor);

    /// Pauses and goes a number of frames (of 30 a second) forward or back; wraps while it loops.
    void step(int frames);
    /// Goes a number of seconds forward or back without pausing; wraps likewise.
    void skip(float seconds);
    void seek(float time);       ///< clamped to the clip
    void seekShare(float share); ///< 0 to 1

private:
    void setClip(size_t clip);
    bool hasLength() const { return m_clips[m_clip].end > m_clips[m_clip].start; }

    orv::AnimationController m_controller;
    std::vector<Clip> m_clips;
    size_t m_clip = 0;
};

} // namespace view
