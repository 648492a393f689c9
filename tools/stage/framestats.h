#pragma once

#include <cstdint>

namespace view
{

/// Statistics of the last frame, and frames per second over about the last half second.
class FrameStats
{
public:
    uint64_t draws = 0;   ///< of the last frame, without the overlay
    uint64_t glCalls = 0; ///< likewise

    /// @param seconds  time of the frame, since any fixed moment.
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

    /// Nothing moves: frames are drawn only occasionally.
    void rest()
    {
        m_count = 0;
        m_perSecond = 0.0;
    }

    double getFramesPerSecond() const { return m_perSecond; } ///< 0 at rest

private:
    static constexpr double SPAN = 0.5;
    static constexpr double LONGEST_FRAME = 2.0;

    int m_count = 0; ///< frames since m_first
    double m_first = 0.0;
    double m_last = 0.0;
    double m_perSecond = 0.0;
};

} // namespace view
