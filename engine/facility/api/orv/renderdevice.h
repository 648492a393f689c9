#pragma once

#include "orv/export.h"

#include <cstdint>

namespace orv
{

/// Facts about the GL implementation behind the current context, and its errors. GL thread only.
class ORV_API RenderDevice
{
public:
    /// Framebuffer errors come before out of memory, unlike in GL.
    enum class ErrorCode : int32_t
    {
        NO_ERROR = 0,
        INVALID_ENUM = 1,
        INVALID_VALUE = 2,
        INVALID_OPERATION = 3,
        INVALID_FRAMEBUFFER_OPERATION = 4,
        OUT_OF_MEMORY = 5,
        UNDEFINED = 6
    };

    RenderDevice() = delete;

    /// GL's own texts; empty ones without a current context.
    static const char* getVendor();
    static const char* getVersion();
    static const char* getExtensions();
    static const char* getShaderVersion();

    static int getMaxVertexUniformVectors(); ///< What the driver has of each; asked once.
    static int getMaxFragmentUniformVectors();
    static int getMaxVertexAttributeVectors();
    static int getMaxVaryingVectors();

    /// The size of the current context's surface in pixels, as EGL tells it.
    /// @return false, outputs untouched, when it cannot: no surface, or a context that EGL has not made.
    static bool getSurfaceSize(int& width, int& height);

    /// Reads a rectangle of the bound framebuffer as RGBA bytes, bottom row first.
    /// @param pixels  room for width x height x 4 bytes.
    static void getPixels(int x, int y, unsigned width, unsigned height, unsigned char* pixels);

    /// Asks GL for an error. One error is remembered for the whole process.
    /// @param clear  false: a fresh error is remembered and returned; without one, NO_ERROR, and the
    ///               remembered one stays. true: the fresh error, or else the remembered one, is returned, and
    ///               none is remembered any more.
    static ErrorCode getError(bool clear);
    static const char* getErrorString(ErrorCode code);

    /// @param name  must appear in GL's list of extensions as a whole word.
    static bool isExtensionSupported(const char* name);
};

/// Logs a fresh GL error, if there is one, under the caller's position; see RenderDevice::getError(false).
ORV_API void checkGLError(const char* file, const char* function, int line);

namespace detail
{

/// The same for callers that have to give something up after an error. Call RenderDevice::getError(false)
/// before the call in question, so that an older error is not taken for its own.
/// @return whether there was an error.
bool reportGLError(const char* file, const char* function, int line);

} // namespace detail

} // namespace orv
