#pragma once

#include "glo/glowriter.h"
#include "names.h"
#include "textures.h"

#include <assimp/material.h>

namespace convert
{

/// A material, and what its meshes need to know of it.
struct ConvertedMaterial
{
    glo::Material material;
    unsigned uvChannel = 0; ///< of the model's texture coordinates, the one to take
    bool hasNormalMap = false;
};

/// @return the kind of the material's first picture, whose texture coordinates all of them have; NONE without one.
aiTextureType findMainTexture(const aiMaterial& material);

/// @return the channel of texture coordinates that the material's first picture asks for; 0 if it has none.
unsigned findUvChannel(const aiMaterial& material);

/// @param repeats  texture coordinates leave the pictures.
ConvertedMaterial convertMaterial(const aiMaterial& source, bool repeats, TextureStore& textures,
                                  NameMaker& names, Report& report);

} // namespace convert
