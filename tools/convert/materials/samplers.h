#pragma once

#include "glo/glowriter.h"
#include "textures.h"

#include <initializer_list>

#include <assimp/material.h>

namespace convert
{

/// The result for one of a material's pictures.
struct MadeSampler
{
    glo::SamplerField field; ///< empty without a readable picture
    bool hasAlpha = false;
    bool isAllOrNothing = false; ///< see TextureUse
};

/// Makes samplers of one material's pictures.
class SamplerMaker
{
public:
    /// @param uvChannel  of the texture coordinates that the scene will have.
    /// @param repeats    these go beyond the pictures.
    SamplerMaker(const aiMaterial& material, unsigned uvChannel, bool repeats, TextureStore& textures,
                 Report& report);

    /// @param types  kinds of picture of the same meaning; the first one present is used.
    /// @param wish   what else to do with it.
    MadeSampler make(std::initializer_list<aiTextureType> types, TextureWish wish = {});

private:
    glo::Sampler readSettings(aiTextureType type);

    const aiMaterial& m_material;
    unsigned m_uvChannel;
    bool m_repeats;
    TextureStore& m_textures;
    Report& m_report;
};

/// @param types  kinds of picture of the same meaning.
/// @return the first that the material has; NONE if it has none.
aiTextureType findTextureType(const aiMaterial& material, std::initializer_list<aiTextureType> types);

/// Path of a material's first picture of a kind; empty if it has none.
std::string getTexturePath(const aiMaterial& material, aiTextureType type);

} // namespace convert
