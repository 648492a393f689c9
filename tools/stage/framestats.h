#pragma once

#include <cstdint>

namespace view
{

/// What drawing takes: of the last frame, and frames per second over about the last half second.
class FrameStats
{
public:
    uint64_t draws = 0;   ///< of the last frame, without what is written over it
    uint64_t glCalls = 0; ///< likewise

    /// @param seconds  since any fixed moment, when a frame was shown.
    void addFrame(double seconds)
    {
        if (m_count == 0 || seconds - m_last > LONGEST_FRAME)
        {
            m_count = 0;
            m_first = seconds;
        }
        else if (seconds - m_first >= SPAN)
        {
            m_perSecond = double(m_count) / (seconds - m_first);
            m_count = 0;
            m_first = seconds;
        }
        ++m_count;
        m_last = seconds;
    }

    /// Nothing moves, so that frames are only drawn now and then.
    void rest()
    {
        m_count = 0;
        m_perSecond = 0.0;
    }

    double getFramesPerSecond() const { return m_perSecond; } ///< 0 at rest

private:
    static constexpr double SPAN = 0.5;
    static constexpr double LONGEST_FRAME = 2.0;

    int m_count = 0; ///< since m_first, which is that of a frame
    double m_first = 0.0;
    double m_last = 0.0;
    double m_perSecond = 0.0;
};

} // namespace view
