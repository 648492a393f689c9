#include "orv/log.h"

#include "platformlog.h"

#include "orv/detail/formattedtext.h"

#include <string>
#include <string_view>

namespace orv
{

namespace
{

/// "file name without directories; function; line"
std::string describePlace(const char* file, const char* function, int line)
{
    std::string_view name(file);
    name.remove_prefix(name.find_last_of("/\\") + 1); // npos + 1 is 0

    std::string place(name);
    return place.append("; ").append(function).append("; ").append(std::to_string(line));
}

void write(LogLevel level, const char* file, const char* function, int line, const char* format,
           va_list arguments)
{
    const detail::LogSink& sink = detail::getLogSink();
    if (level < sink.lowest)
        return;
    const std::string place = describePlace(file, function, line);
    if (sink.function)
        sink.function(level, place.c_str(), detail::FormattedText(format, arguments).get(), sink.user);
    else
        detail::writeToPlatform(level, (place + "; " + format).c_str(), arguments);
}

} // namespace

} // namespace orv

#define ORV_LOG_ENTRY_POINT(name, level)                                                                     \
    void name(const char* file, const char* function, int line, const char* format, ...)                     \
    {                                                                                                        \
        va_list arguments;                                                                                   \
        va_start(arguments, format);                                                                         \
        orv::write(orv::LogLevel::level, file, function, line, format, arguments);                           \
        va_end(arguments);                                                                                   \
    }

ORV_LOG_ENTRY_POINT(pssLogError, ERROR)
ORV_LOG_ENTRY_POINT(pssLogWarn, WARNING)
ORV_LOG_ENTRY_POINT(pssLogInfo, INFO)
ORV_LOG_ENTRY_POINT(pssLogDebug, DEBUGGING)

void pssLogInit() {}

void pssLogDeInit() {}
