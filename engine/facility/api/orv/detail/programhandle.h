#pragma once

#include "orv/sharedptr.h"

namespace orv
{

class ShaderProgram;

namespace detail
{

/// Outlives its program, so that code that remembers the program can see that it is gone.
class ProgramHandle : public Shared
{
public:
    ORV_CLASS_NAME("ProgramHandle")

    ShaderProgram* program = nullptr; ///< null once the program is destroyed
};

} // namespace detail
} // namespace orv
