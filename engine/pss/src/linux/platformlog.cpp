#include "platformlog.h"

#include <cstdio>
#include <string>

namespace orv::detail
{

/// With a single call, so that records of several threads do not mix.
void writeToPlatform(LogLevel level, const char* format, va_list arguments)
{
    static const char LETTERS[] = "DIWE";
    const std::string record = LETTERS[int(level)] + ("/ORV: " + std::string(format)) + '\n';
    std::vfprintf(stderr, record.c_str(), arguments);
}

} // namespace orv::detail
