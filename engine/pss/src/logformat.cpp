#include "logformat.h"

#include <string_view>

namespace orv::detail
{

std::string logFormat(const char* file, const char* function, int line, const char* format)
{
    std::string_view name(file);
    name.remove_prefix(name.find_last_of("/\\") + 1); // npos + 1 is 0

    std::string record(name);
    record.append("; ").append(function).append("; ").append(std::to_string(line)).append("; ");
    return record.append(format);
}

} // namespace orv::detail
