#include "loadlog.h"

#include "commandline/terminaltext.h"

#include "orv/logsink.h"

#include <cstdio>
#include <sstream>

namespace view::loadlog
{

namespace
{

int g_errorCount = 0;
std::string g_message;

void write(orv::LogLevel level, const char* place, const char* text, void*)
{
    if (level == orv::LogLevel::ERROR && g_errorCount++ == 0)
        g_message = text;
    std::istringstream lines(text); // shader compilers write several
    std::string shown;
    for (std::string line; std::getline(lines, line);)
        shown += (shown.empty() ? "" : "\n") + commandline::toTerminalText(line);
    std::fprintf(stderr, "%c/ORV: %s; %s\n", level == orv::LogLevel::ERROR ? 'E' : 'W', place, shown.c_str());
}

} // namespace

void start()
{
    orv::setLogLevel(orv::LogLevel::WARNING);
    orv::setLogFunction(write);
}

void reset()
{
    g_errorCount = 0;
    g_message.clear();
}

int getErrorCount()
{
    return g_errorCount;
}

std::string getMessage()
{
    return g_message;
}

} // namespace view::loadlog
