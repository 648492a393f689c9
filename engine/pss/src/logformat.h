#pragma once

#include <string>

namespace orv::detail
{

/// The printf format of one log record: file name without directories, function, line and the caller's format,
/// separated by "; ".
std::string logFormat(const char* file, const char* function, int line, const char* format);

} // namespace orv::detail
