#include "statuslines.h"

#include <cstdio>

namespace view
{

namespace
{

/// "1 draw", "4,212 triangles"
std::string count(uint64_t number, const char* what)
{
    std::string text = std::to_string(number);
    for (int i = int(text.size()) - 3; i > 0; i -= 3)
        text.insert(size_t(i), ",");
    return text + " " + what + (number == 1 ? "" : "s");
}

std::string toText(const char* format, double value)
{
    char text[40];
    std::snprintf(text, sizeof text, format, value);
    return text;
}

} // namespace

std::string describeFrame(const FrameStats& stats, uint64_t triangleCount)
{
    const double framesPerSecond = stats.getFramesPerSecond();
    return (framesPerSecond > 0.0 ? toText("%.0f fps", framesPerSecond) : "at rest") + "   " +
           count(stats.draws, "draw") + "   " + count(triangleCount, "triangle") + "   " +
           count(stats.glCalls, "GL call");
}

std::string describeClip(const Player& player)
{
    const Clip& clip = player.getClip();
    if (clip.end <= clip.start)
        return {};
    std::string text = "\n" + clip.name + "   " + toText("%.2f", player.getTime() - clip.start) +
                       toText(" of %.2f s", clip.end - clip.start);
    text += player.isMoving() ? "   playing" : player.isPaused() ? "   paused" : "   at its end";
    if (player.getSpeed() != 1.0f)
        text += toText(", speed %g", player.getSpeed());
    return text + (player.isLooping() ? ", in a loop" : ", once");
}

} // namespace view
