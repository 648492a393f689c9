#include "orv/log.h"

#include "logformat.h"

#include <cstdarg>
#include <cstdio>

namespace
{

/// One call, so that records from several threads do not mix.
void writeRecord(const char* level, const char* file, const char* function, int line, const char* format,
                 va_list arguments)
{
    const std::string record = level + orv::detail::logFormat(file, function, line, format) + '\n';
    std::vfprintf(stderr, record.c_str(), arguments);
}

} // namespace

void pssLogError(const char* file, const char* function, int line, const char* format, ...)
{
    va_list arguments;
    va_start(arguments, format);
    writeRecord("E/ORV: ", file, function, line, format, arguments);
    va_end(arguments);
}

void pssLogWarn(const char* file, const char* function, int line, const char* format, ...)
{
    va_list arguments;
    va_start(arguments, format);
    writeRecord("W/ORV: ", file, function, line, format, arguments);
    va_end(arguments);
}

void pssLogInfo(const char* file, const char* function, int line, const char* format, ...)
{
    va_list arguments;
    va_start(arguments, format);
    writeRecord("I/ORV: ", file, function, line, format, arguments);
    va_end(arguments);
}

void pssLogDebug(const char* file, const char* function, int line, const char* format, ...)
{
    va_list arguments;
    va_start(arguments, format);
    writeRecord("D/ORV: ", file, function, line, format, arguments);
    va_end(arguments);
}

void pssLogInit() {}

void pssLogDeInit() {}
