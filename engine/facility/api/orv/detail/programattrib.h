#pragma once

#include <string>

namespace orv::detail
{

/// An active vertex attribute of a linked program.
struct ProgramAttrib
{
    std::string name;
    int location = -1;
};

} // namespace orv::detail
