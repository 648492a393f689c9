#include "orv/log.h"

#include "logformat.h"

#include <android/log.h>

#include <cstdarg>

namespace
{

void writeRecord(android_LogPriority priority, const char* file, const char* function, int line,
                 const char* format, va_list arguments)
{
    const std::string record = orv::detail::logFormat(file, function, line, format);
    __android_log_vprint(priority, "ORV", record.c_str(), arguments);
}

} // namespace

void pssLogError(const char* file, const char* function, int line, const char* format, ...)
{
    va_list arguments;
    va_start(arguments, format);
    writeRecord(ANDROID_LOG_ERROR, file, function, line, format, arguments);
    va_end(arguments);
}

void pssLogWarn(const char* file, const char* function, int line, const char* format, ...)
{
    va_list arguments;
    va_start(arguments, format);
    writeRecord(ANDROID_LOG_WARN, file, function, line, format, arguments);
    va_end(arguments);
}

void pssLogInfo(const char* file, const char* function, int line, const char* format, ...)
{
    va_list arguments;
    va_start(arguments, format);
    writeRecord(ANDROID_LOG_INFO, file, function, line, format, arguments);
    va_end(arguments);
}

void pssLogDebug(const char* file, const char* function, int line, const char* format, ...)
{
    va_list arguments;
    va_start(arguments, format);
    writeRecord(ANDROID_LOG_DEBUG, file, function, line, format, arguments);
    va_end(arguments);
}

void pssLogInit() {}

void pssLogDeInit() {}
