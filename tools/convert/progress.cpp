#include "progress.h"

#include "commandline/terminaltext.h"

#include <algorithm>
#include <chrono>
#include <cstdio>

#include <unistd.h>

namespace convert
{

namespace
{

using Clock = std::chrono::steady_clock;

constexpr std::chrono::milliseconds PATIENCE(500);
constexpr std::chrono::milliseconds BETWEEN(100);
constexpr size_t LONGEST = 60; // characters, for narrow terminals

const Clock::time_point g_start = Clock::now();
Clock::time_point g_shown = g_start;
std::FILE* g_stream = stderr;

bool isWatched()
{
    static const bool isTerminal = isatty(STDERR_FILENO) != 0;
    return isTerminal;
}

float getShare(int step, int steps)
{
    return steps > 0 ? float(step) / float(steps) : -1.0f;
}

} // namespace

void showProgress(const std::string& what, float share)
{
    const Clock::time_point now = Clock::now();
    if (!isWatched() || now - g_start < PATIENCE || now - g_shown < BETWEEN)
        return;
    g_shown = now;
    std::string line = commandline::toTerminalText(what.substr(0, LONGEST));
    if (share >= 0.0f)
        line += " " + std::to_string(int(std::min(share, 1.0f) * 100.0f)) + " %";
    std::fprintf(g_stream, "\r\033[K%s", line.c_str()); // goes to the line's start and clears the line
    std::fflush(g_stream);
}

int moveProgress()
{
    const int descriptor = isWatched() ? dup(STDERR_FILENO) : -1;
    std::FILE* stream = descriptor < 0 ? nullptr : fdopen(descriptor, "w");
    if (stream)
        g_stream = stream;
    return stream ? descriptor : -1;
}

void clearProgress()
{
    if (isWatched())
        std::fputs("\r\033[K", g_stream);
}

bool ImportProgress::Update(float percentage)
{
    showProgress("reading the model", percentage);
    return true; // go on
}

void ImportProgress::UpdateFileRead(int step, int steps)
{
    showProgress("reading the model", getShare(step, steps));
}

void ImportProgress::UpdatePostProcess(int step, int steps)
{
    showProgress("preparing the model", getShare(step, steps));
}

} // namespace convert
