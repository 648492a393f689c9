#include "samplers.h"

#include "materialvalues.h"

#include "orv/texture.h"

#include <assimp/GltfMaterial.h>

namespace convert
{

namespace
{

using orv::TextureParameters;
using FilterMode = TextureParameters::FilterMode;
using WrapMode = TextureParameters::WrapMode;

WrapMode toWrapMode(aiTextureMapMode mode)
{
    switch (mode)
    {
    case aiTextureMapMode_Clamp:
    case aiTextureMapMode_Decal: return WrapMode::CLAMP;
    case aiTextureMapMode_Mirror: return WrapMode::MIRRORED_REPEAT;
    default: return WrapMode::REPEAT;
    }
}

/// @param name  GL's name of a filter; others give the fallback.
FilterMode toFilterMode(int name, FilterMode fallback)
{
    switch (name)
    {
    case 0x2600: return FilterMode::NEAREST;
    case 0x2601: return FilterMode::LINEAR;
    case 0x2700: return FilterMode::NEAREST_MIPMAP_NEAREST;
    case 0x2701: return FilterMode::LINEAR_MIPMAP_NEAREST;
    case 0x2702: return FilterMode::NEAREST_MIPMAP_LINEAR;
    case 0x2703: return FilterMode::LINEAR_MIPMAP_LINEAR;
    default: return fallback;
    }
}

} // namespace

SamplerMaker::SamplerMaker(const aiMaterial& material, unsigned uvChannel, bool repeats,
                           TextureStore& textures, Report& report)
    : m_material(material)
    , m_uvChannel(uvChannel)
    , m_repeats(repeats)
    , m_textures(textures)
    , m_report(report)
{
}

MadeSampler SamplerMaker::make(std::initializer_list<aiTextureType> types, TextureWish wish)
{
    const aiTextureType type = findTextureType(m_material, types);
    if (type == aiTextureType_NONE)
        return {};
    glo::Sampler sampler = readSettings(type);
    const uint32_t clamp = uint32_t(WrapMode::CLAMP);
    wish.path = getTexturePath(m_material, type);
    wish.sampling = {sampler.minFilter, sampler.magFilter, sampler.wrapHorizontal, sampler.wrapVertical};
    wish.repeats = m_repeats && (sampler.wrapHorizontal != clamp || sampler.wrapVertical != clamp);
    const TextureUse use = m_textures.add(wish);
    if (use.name.empty())
        return {};
    if (!use.isPowerOfTwo) // GL repeats no others, and no coordinate goes beyond this one
        sampler.wrapHorizontal = sampler.wrapVertical = clamp;
    if (!use.isPowerOfTwo && sampler.minFilter > uint32_t(FilterMode::LINEAR))
        m_report.approximate("mipmaps", "mipmaps of a texture whose sides are not powers of two (none; "
                                        "--power-of-two would help)");
    sampler.image = use.name;
    return {sampler, use.hasAlpha, use.isAllOrNothing};
}

/// Sets filters and wrapping; reports other settings.
glo::Sampler SamplerMaker::readSettings(aiTextureType type)
{
    aiString path;
    aiTextureMapMode modes[2] = {aiTextureMapMode_Wrap, aiTextureMapMode_Wrap};
    unsigned channel = 0;
    m_material.GetTexture(type, 0, &path, nullptr, &channel, nullptr, nullptr, modes);
    if (m_material.GetTextureCount(type) > 1)
        m_report.lose("texture-layers", "a material's further layers of one kind of texture");
    if (channel != m_uvChannel)
        m_report.lose("texture-uv-set",
                      "a texture's own coordinates (it uses those of the material's first)");
    if (modes[0] == aiTextureMapMode_Decal || modes[1] == aiTextureMapMode_Decal)
        m_report.approximate("texture-decal", "a texture that ends at its edge (the edge is continued)");

    glo::Sampler sampler;
    sampler.minFilter = uint32_t(toFilterMode(getInt(m_material, AI_MATKEY_GLTF_MAPPINGFILTER_MIN(type, 0)),
                                              FilterMode::LINEAR_MIPMAP_LINEAR));
    sampler.magFilter = uint32_t(
        toFilterMode(getInt(m_material, AI_MATKEY_GLTF_MAPPINGFILTER_MAG(type, 0)), FilterMode::LINEAR));
    sampler.wrapHorizontal = uint32_t(toWrapMode(modes[0]));
    sampler.wrapVertical = uint32_t(toWrapMode(modes[1]));
    return sampler;
}

aiTextureType findTextureType(const aiMaterial& material, std::initializer_list<aiTextureType> types)
{
    for (const aiTextureType type : types)
    {
        if (!getTexturePath(material, type).empty())
            return type;
    }
    return aiTextureType_NONE;
}

std::string getTexturePath(const aiMaterial& material, aiTextureType type)
{
    aiString path;
    return material.GetTexture(type, 0, &path) == aiReturn_SUCCESS ? path.C_Str() : "";
}

} // namespace convert
