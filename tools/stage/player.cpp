#include "player.h"

#include <algorithm>
#include <cmath>

namespace view
{

namespace
{

constexpr float FRAMES_PER_SECOND = 30.0f;
constexpr float SLOWEST = 1.0f / 64.0f;
constexpr float FASTEST = 64.0f;

} // namespace

Clip makeClip(const std::string& name, const orv::Animation& animation)
{
    const float start = animation.getStart();
    const float end = animation.getEnd();
    return std::isfinite(end - start) ? Clip{name, start, end} : Clip{name};
}

Player::Player(const orv::SharedPtr<orv::Animation>& animation, std::vector<Clip> clips)
    : m_controller(animation)
    , m_clips(std::move(clips))
{
    setClip(0);
}

void Player::continueFrom(const Player& other)
{
    chooseClip(other.getClip().name);
    seek(other.getTime());
    setPaused(other.isPaused());
    setLooping(other.isLooping());
    m_controller.setSpeed(other.getSpeed());
}

void Player::setClip(size_t clip)
{
    m_clip = clip;
    setRange(m_controller, m_clips[clip].start, m_clips[clip].end);
    setLoopRange(m_controller, m_clips[clip].start, m_clips[clip].end);
    seek(m_clips[clip].start);
}

bool Player::chooseClip(const std::string& name)
{
    const auto found =
        std::find_if(m_clips.begin(), m_clips.end(), [&](const Clip& clip) { return clip.name == name; });
    if (found == m_clips.end())
        return false;
    setClip(size_t(found - m_clips.begin()));
    return true;
}

bool Player::chooseClip(const std::string& name, std::string& error)
{
    if (chooseClip(name))
        return true;
    error = "no clip \"" + name + "\"; there are \"";
    for (const Clip& clip : m_clips)
        error += clip.name + (&clip == &m_clips.back() ? "\"" : "\", \"");
    return false;
}

void Player::stepClip(int count)
{
    const int size = int(m_clips.size());
    setClip(size_t(((int(m_clip) + count) % size + size) % size));
}

float Player::getShare() const
{
    return hasLength() ? (getTime() - getClip().start) / (getClip().end - getClip().start) : 0.0f;
}

bool Player::isMoving() const
{
    return hasLength() && !isPaused() && (isLooping() || !isFinished(m_controller));
}

void Player::update(float seconds)
{
    m_controller.update(seconds);
}

void Player::setPaused(bool paused)
{
    m_controller.setPaused(paused);
}

void Player::togglePaused()
{
    const bool isOver = hasLength() && !isLooping() && isFinished(m_controller);
    if (isPaused() || isOver)
        play(m_controller, true);
    else
        pause(m_controller, false);
}

void Player::scaleSpeed(float factor)
{
    m_controller.setSpeed(std::clamp(getSpeed() * factor, SLOWEST, FASTEST));
}

void Player::step(int frames)
{
    setPaused(true);
    skip(float(frames) / FRAMES_PER_SECOND);
}

void Player::skip(float seconds)
{
    const Clip& clip = getClip();
    const float time = getTime() + seconds;
    const float length = clip.end - clip.start;
    if (!isLooping() || !hasLength() || (time >= clip.start && time < clip.end))
        return seek(time);
    const float beyond = std::fmod(time - clip.start, length);
    seek(clip.start + (beyond < 0.0f ? beyond + length : beyond));
}

void Player::seek(float time)
{
    orv::seek(m_controller, time);
}

void Player::seekShare(float share)
{
    seek(getClip().start + (getClip().end - getClip().start) * share);
}

} // namespace view
