#include "platformlog.h"

#include <android/log.h>

namespace orv::detail
{

void writeToPlatform(LogLevel level, const char* format, va_list arguments)
{
    static const android_LogPriority PRIORITIES[] = {ANDROID_LOG_DEBUG, ANDROID_LOG_INFO, ANDROID_LOG_WARN,
                                                     ANDROID_LOG_ERROR};
    __android_log_vprint(PRIORITIES[int(level)], "ORV", format, arguments);
}

} // namespace orv::detail
