#include "orv/logsink.h"

namespace orv
{

namespace
{

detail::LogSink g_sink;

} // namespace

void setLogFunction(LogFunction function, void* user)
{
    g_sink.function = function;
    g_sink.user = user;
}

void setLogLevel(LogLevel lowest)
{
    g_sink.lowest = lowest;
}

const detail::LogSink& detail::getLogSink()
{
    return g_sink;
}

} // namespace orv
