#include "loadlog.h"

#include "orv/logsink.h"

#include <cstdio>

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
    std::fprintf(stderr, "%c/ORV: %s; %s\n", level == orv::LogLevel::ERROR ? 'E' : 'W', place, text);
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
