#pragma once

#include "orv/shaderuniform.h"
#include "orv/sharedptr.h"

#include <cstddef>
#include <cstdint>
#include <vector>

namespace orv::detail
{

/// What the draw path reads of a uniform.
struct DrawnUniform
{
    SharedPtr<ShaderUniformBase> value;  ///< set from outside, may be null
    SharedPtr<ShaderUniformBase> linked; ///< the context's property, may be null
    SharedPtr<ShaderUniformBase> sent;   ///< the values sent last; null for a sampler
    uint64_t sentRevision = 0;           ///< of the source that was compared last
    int location = -1;
    int textureUnit = -1;       ///< first of a sampler's units; -1 for other types
    int size = 1;               ///< array size
    unsigned textureTarget = 0; ///< of a sampler
};

/// Where the uniforms of a program take their values from, found out once, so that a draw follows pointers and
/// compares no names. The pointers are borrowed; the program renews its revision when they are stale.
struct UniformSources
{
    struct Value
    {
        const ShaderUniformBase* source;
        DrawnUniform* uniform;
        /// The uniform's value sent last, if it and source are single ones of this type; else null.
        Vector4f* sentVector;
    };

    /// A texture unit, one for each element of a sampler that is an array.
    struct Unit
    {
        const ShaderUniformBase* source; ///< null for want of one
        int unit;
        unsigned target;
        int slot;      ///< where the context remembers its texture
        unsigned name; ///< of the texture, as of readyRevision
    };

    uint64_t revision = 0;     ///< the program's; 0 makes it look up everything again
    std::vector<Value> values; ///< but for samplers and transforms; those that were handed to enable() first
    std::size_t ownCount = 0;  ///< of values: those handed to enable()
    uint64_t ownUniforms = 0;  ///< a bit for each uniform of these
    std::vector<Unit> units;
    uint64_t readyRevision = 0; ///< of all changes when the names of textures were looked up
    /// By DrawTransform, single matrices that take a property which has that; null where there is none.
    DrawnUniform* transforms[DRAW_TRANSFORM_COUNT] = {};
    const ShaderUniformBase* transformSources[DRAW_TRANSFORM_COUNT] = {};
    bool readsTransforms =
        false; ///< one of values is such a property too: an array, or a second one that takes it
};

} // namespace orv::detail
