#pragma once

#include "convert/names.h"
#include "glo/glowriter.h"
#include "textures.h"

#include <assimp/material.h>

namespace convert
{

/// Context of a material.
struct MaterialUse
{
    std::string linear;      ///< see Options
    bool sky = false;        ///< the same
    bool repeats = false;    ///< texture coordinates go beyond the pictures
    bool hasColours = false; ///< some vertices have colours
    bool isSurface = false;  ///< some meshes have triangles or normals, so that they are lit
};

/// A material, and values that its meshes need.
struct ConvertedMaterial
{
    glo::Material material;
    bool hasLightColours = false; ///< vertex colours are linear
    bool usesVertexAlpha = false;
    unsigned uvChannel = 0; ///< which of the model's texture coordinates to use
    bool hasNormalMap = false;
    bool isFlat = false; ///< for meshes without normals; in most formats they are smooth
};

/// @return the kind of the material's first picture, whose texture coordinates are used for all; NONE without one.
aiTextureType findMainTexture(const aiMaterial& material);

/// @return the channel of texture coordinates of the material's first picture; 0 if it has none.
unsigned findUvChannel(const aiMaterial& material);

ConvertedMaterial convertMaterial(const aiMaterial& source, const MaterialUse& use, TextureStore& textures,
                                  NameMaker& names, Report& report);

} // namespace convert
