#pragma once

#include "orv/assetcache.h"
#include "orv/export.h"
#include "orv/shaderprogram.h"

namespace orv
{

/// Makes shader programs and keeps them by name. GL thread only.
class ORV_API ShaderProgramCache : public AssetCache<ShaderProgram>
{
public:
    /// Logs whether the driver supports program binaries, so a GL context must be current.
    ShaderProgramCache();

    /// Compiles and links. The shader objects are deleted by the next flush().
    /// @param name  the name to keep the program under; null keeps it without one.
    /// @return null, after logging why, when a source is null or does not compile or link.
    SharedPtr<ShaderProgram> create(const char* vertexSource, const char* fragmentSource, const char* name);

    /// Makes a program from a binary that ShaderProgram::getBinary() gave on this driver.
    /// @return null, after logging why, when binaries are unsupported or the driver refuses this one.
    SharedPtr<ShaderProgram> create(unsigned int length, unsigned int format, const char* binary,
                                    const char* name);
};

/// Whether the driver has GL_OES_get_program_binary.
ORV_API bool getShaderProgramBinariesSupported();

} // namespace orv
