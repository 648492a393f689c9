#pragma once

#include "orv/logsink.h"

#include <cstdarg>

namespace orv::detail
{

/// Writes one record to the platform's log.
/// @param format  printf's, of the whole record: where it is from, and the message.
void writeToPlatform(LogLevel level, const char* format, va_list arguments);

} // namespace orv::detail
