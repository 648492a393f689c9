#pragma once

#include "orv/export.h"

namespace orv
{

/// GL extensions that the engine uses where they are there. All of these need a current GL context on the first
/// call; the two answers are remembered for the life of the process, even across a lost context.

ORV_API bool GL_OES_EGL_image_external_supported();
ORV_API bool GL_OES_get_program_binary_supported(); ///< Whether the driver has it; asked once.

/// The entry points of the extension.
using GetProgramBinaryFunction = void (*)(unsigned int program, int capacity, int* length,
                                          unsigned int* format, void* binary);
using ProgramBinaryFunction = void (*)(unsigned int program, unsigned int format, const void* binary,
                                       int length);

/// The entry points of GL_OES_get_program_binary. @return null, after an error, if it is not supported.
ORV_API GetProgramBinaryFunction get_glGetProgramBinaryOES();
ORV_API ProgramBinaryFunction get_glProgramBinaryOES();

} // namespace orv
