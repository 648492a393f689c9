#pragma once

#include "convert/names.h"
#include "glo/glowriter.h"
#include "textures.h"

#include <assimp/material.h>

namespace convert
{

/// What a material has to know besides.
struct MaterialUse
{
    std::string linear;      ///< see Options
    bool sky = false;        ///< the same
    bool repeats = false;    ///< texture coordinates leave the pictures
    bool hasColours = false; ///< some vertices have colours of their own
    bool isSurface = false;  ///< some meshes have triangles or normals, so that light counts
};

/// A material, and what its meshes need to know of it.
struct ConvertedMaterial
{
    glo::Material material;
    bool hasLightColours = false; ///< colours of vertices are shares of light
    bool usesVertexAlpha = false;
    unsigned uvChannel = 0; ///< of the model's texture coordinates, the one to take
    bool hasNormalMap = false;
    bool isFlat = false; ///< where a mesh has no normals; of most formats such meshes are smooth
};

/// @return the kind of the material's first picture, whose texture coordinates all of them have; NONE without one.
aiTextureType findMainTexture(const aiMaterial& material);

/// @return the channel of texture coordinates that the material's first picture asks for; 0 if it has none.
unsigned findUvChannel(const aiMaterial& material);

ConvertedMaterial convertMaterial(const aiMaterial& source, const MaterialUse& use, TextureStore& textures,
                                  NameMaker& names, Report& report);

} // namespace convert
