#include "orv/extensions.h"

#include "orv/log.h"
#include "orv/renderdevice.h"

#include <EGL/egl.h>

namespace orv
{

namespace
{

/// Looks an entry point of GL_OES_get_program_binary up until it is found.
template <class Function>
Function lookUp(Function& known, const char* name)
{
    if (known)
        return known;
    if (!GL_OES_get_program_binary_supported())
    {
        ORV_LOG_ERROR("Extension \"GL_OES_get_program_binary\" not supported.");
        return nullptr;
    }
    known = reinterpret_cast<Function>(eglGetProcAddress(name));
    return known;
}

} // namespace

bool GL_OES_EGL_image_external_supported()
{
    static const bool supported = RenderDevice::isExtensionSupported("GL_OES_EGL_image_external");
    return supported;
}

bool GL_OES_get_program_binary_supported()
{
    static const bool supported = RenderDevice::isExtensionSupported("GL_OES_get_program_binary");
    return supported;
}

GetProgramBinaryFunction get_glGetProgramBinaryOES()
{
    static GetProgramBinaryFunction function = nullptr;
    return lookUp(function, "glGetProgramBinaryOES");
}

ProgramBinaryFunction get_glProgramBinaryOES()
{
    static ProgramBinaryFunction function = nullptr;
    return lookUp(function, "glProgramBinaryOES");
}

} // namespace orv
