#pragma once

#include "orv/shaderuniform.h"
#include "orv/texture2d.h"
#include "orv/texturecube.h"

namespace orv::detail
{

/// The attribute count of the last ShaderProgram::bind() of any program.
extern int g_boundAttribCount;

/// The texture that a sampler of this target reads from source; 0 when source holds none that fits.
inline unsigned getTextureName(const ShaderUniformBase& source, unsigned target)
{
    if (source.holds<SharedPtr<Texture2D>>())
    {
        const Texture2D* texture =
            static_cast<const ShaderUniform<SharedPtr<Texture2D>>&>(source).get().get();
        return texture && texture->getTarget() == target ? texture->getId() : 0;
    }
    if (source.holds<SharedPtr<TextureCube>>())
    {
        const TextureCube* texture =
            static_cast<const ShaderUniform<SharedPtr<TextureCube>>&>(source).get().get();
        return texture && texture->getTarget() == target ? texture->getId() : 0;
    }
    return 0;
}

} // namespace orv::detail
