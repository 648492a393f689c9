#include "materials.h"

#include <assimp/GltfMaterial.h>
#include <assimp/material.h>

#include <algorithm>
#include <cmath>

namespace convert
{

using orv::Vector4f;

namespace
{

constexpr float ALMOST_OPAQUE = 0.999f; // blended, and looks opaque

Vector4f getColour(const aiMaterial& material, const char* key, unsigned type, unsigned index,
                   const Vector4f& fallback)
{
    aiColor4D colour;
    if (material.Get(key, type, index, colour) != aiReturn_SUCCESS)
        return fallback;
    return Vector4f(colour.r, colour.g, colour.b, 1.0f);
}

float getFloat(const aiMaterial& material, const char* key, unsigned type, unsigned index, float fallback)
{
    float value;
    return material.Get(key, type, index, value) == aiReturn_SUCCESS && std::isfinite(value) ? value
                                                                                             : fallback;
}

bool isBlack(const Vector4f& colour)
{
    return colour.x == 0.0f && colour.y == 0.0f && colour.z == 0.0f;
}

uint32_t toWrapMode(aiTextureMapMode mode)
{
    switch (mode)
    {
    case aiTextureMapMode_Clamp:
    case aiTextureMapMode_Decal: return 1;
    case aiTextureMapMode_Mirror: return 2;
    default: return 0;
    }
}

/// Makes samplers of one material's pictures.
class SamplerMaker
{
public:
    SamplerMaker(const aiMaterial& material, bool repeats, TextureStore& textures, Report& report)
        : m_material(material)
        , m_repeats(repeats)
        , m_textures(textures)
        , m_report(report)
    {
    }

    /// @param hasAlpha  set if the picture is partly transparent.
    glo::SamplerField make(aiTextureType type, bool* hasAlpha = nullptr)
    {
        aiString path;
        aiTextureMapMode modes[2] = {aiTextureMapMode_Wrap, aiTextureMapMode_Wrap};
        unsigned channel = 0;
        if (m_material.GetTexture(type, 0, &path, nullptr, &channel, nullptr, nullptr, modes) !=
            aiReturn_SUCCESS)
            return {};
        if (m_material.GetTextureCount(type) > 1)
            m_report.lose("a material's further layers of one kind of texture");
        if (channel != findUvChannel(m_material))
            m_report.lose("a second set of texture coordinates");

        glo::Sampler sampler;
        sampler.minFilter = 5;
        sampler.wrapHorizontal = toWrapMode(modes[0]);
        sampler.wrapVertical = toWrapMode(modes[1]);
        const TextureUse use = m_textures.add(
            path.C_Str(), m_repeats && (sampler.wrapHorizontal != 1 || sampler.wrapVertical != 1));
        if (use.name.empty())
            return {};
        if (hasAlpha)
            *hasAlpha = use.hasAlpha;
        sampler.image = use.name;
        return sampler;
    }

private:
    const aiMaterial& m_material;
    bool m_repeats;
    TextureStore& m_textures;
    Report& m_report;
};

/// The highlight of a surface by its roughness and metalness.
void setSpecularFromRoughness(const aiMaterial& source, glo::StandardMaterial& made)
{
    const float metal = getFloat(source, AI_MATKEY_METALLIC_FACTOR, 1.0f);
    const float roughness = std::clamp(getFloat(source, AI_MATKEY_ROUGHNESS_FACTOR, 1.0f), 0.15f, 1.0f);
    made.shininess = std::clamp(2.0f / std::pow(roughness, 4.0f) - 2.0f, 1.0f, 128.0f);
    made.specularLevel = 0.5f * (1.0f - roughness) * (1.0f - roughness);
    const Vector4f base = made.diffuse.colour;
    const auto mix = [metal](float colour) { return 1.0f + (colour - 1.0f) * metal; };
    made.specular.colour = Vector4f(mix(base.x), mix(base.y), mix(base.z), 1.0f);
}

void setSpecular(const aiMaterial& source, glo::StandardMaterial& made)
{
    float unused;
    if (source.Get(AI_MATKEY_METALLIC_FACTOR, unused) == aiReturn_SUCCESS)
        return setSpecularFromRoughness(source, made);
    made.specular.colour = getColour(source, AI_MATKEY_COLOR_SPECULAR, Vector4f(0, 0, 0, 1));
    made.shininess = std::min(getFloat(source, AI_MATKEY_SHININESS, 0.0f), 128.0f);
    made.specularLevel = getFloat(source, AI_MATKEY_SHININESS_STRENGTH, 1.0f);
    int model = 0;
    source.Get(AI_MATKEY_SHADING_MODEL, model);
    const bool isDull =
        model == aiShadingMode_Gouraud || model == aiShadingMode_Flat || model == aiShadingMode_NoShading;
    if (isDull || made.shininess <= 0.0f) // an exponent of 0 would be a highlight all over
    {
        made.specularLevel = 0.0f;
        made.shininess = 1.0f;
    }
}

/// How the alpha channel of the base picture is meant.
bool isBlended(const aiMaterial& source, bool hasAlpha, Report& report)
{
    aiString mode;
    if (source.Get(AI_MATKEY_GLTF_ALPHAMODE, mode) == aiReturn_SUCCESS)
    {
        if (std::string(mode.C_Str()) == "MASK")
            report.lose("a cut-out edge (drawn blended)");
        return std::string(mode.C_Str()) != "OPAQUE";
    }
    int flags = 0;
    source.Get(AI_MATKEY_TEXFLAGS_DIFFUSE(0), flags);
    return (flags & aiTextureFlags_UseAlpha) || (hasAlpha && !(flags & aiTextureFlags_IgnoreAlpha));
}

float getOpacity(const aiMaterial& source, bool hasAlpha, Report& report)
{
    float opacity = getFloat(source, AI_MATKEY_OPACITY, 1.0f);
    if (opacity <= 0.0f)
    {
        report.lose("an opacity of 0, which some programs write for none (drawn opaque)");
        opacity = 1.0f;
    }
    return isBlended(source, hasAlpha, report) ? std::min(opacity, ALMOST_OPAQUE) : opacity;
}

void reportUnused(const aiMaterial& source, Report& report)
{
    const struct
    {
        aiTextureType type;
        const char* loss;
    } kinds[] = {
        {aiTextureType_OPACITY, "an opacity map of its own"},
        {aiTextureType_REFLECTION, "a reflection map"},
        {aiTextureType_LIGHTMAP, "a light map"},
        {aiTextureType_METALNESS, "a metalness map"},
        {aiTextureType_DIFFUSE_ROUGHNESS, "a roughness map"},
        {aiTextureType_HEIGHT, "a height map"},
    };
    aiString diffuse;
    aiString path;
    source.GetTexture(aiTextureType_DIFFUSE, 0, &diffuse);
    for (const auto& kind : kinds)
    {
        if (source.GetTexture(kind.type, 0, &path) == aiReturn_SUCCESS && !(path == diffuse))
            report.lose(kind.loss);
    }
}

} // namespace

unsigned findUvChannel(const aiMaterial& material)
{
    for (const aiTextureType type :
         {aiTextureType_DIFFUSE, aiTextureType_NORMALS, aiTextureType_EMISSIVE, aiTextureType_SPECULAR})
    {
        aiString path;
        unsigned channel = 0;
        if (material.GetTexture(type, 0, &path, nullptr, &channel) == aiReturn_SUCCESS)
            return channel;
    }
    return 0;
}

ConvertedMaterial convertMaterial(const aiMaterial& source, bool repeats, TextureStore& textures,
                                  NameMaker& names, Report& report)
{
    SamplerMaker samplers(source, repeats, textures, report);
    glo::StandardMaterial made;
    bool hasAlpha = false;
    made.diffuse.colour = getColour(source, AI_MATKEY_COLOR_DIFFUSE, Vector4f(0.6f, 0.6f, 0.6f, 1.0f));
    made.diffuse.sampler = samplers.make(aiTextureType_DIFFUSE, &hasAlpha);
    if (made.diffuse.sampler && isBlack(made.diffuse.colour))
        made.diffuse.colour = Vector4f(1.0f, 1.0f, 1.0f, 1.0f); // black would hide the picture
    made.ambient.colour = made.diffuse.colour;                  // for lights that have an ambient part
    made.emissive.colour = getColour(source, AI_MATKEY_COLOR_EMISSIVE, Vector4f(0, 0, 0, 1));
    made.emissive.sampler = samplers.make(aiTextureType_EMISSIVE);
    setSpecular(source, made);
    made.specular.sampler = samplers.make(aiTextureType_SPECULAR);
    made.bump = samplers.make(aiTextureType_NORMALS);
    made.opacity = getOpacity(source, hasAlpha, report);
    int twoSided = 0;
    source.Get(AI_MATKEY_TWOSIDED, twoSided);
    made.doubleSided = twoSided != 0;
    reportUnused(source, report);

    ConvertedMaterial converted;
    converted.uvChannel = findUvChannel(source);
    converted.hasNormalMap = made.bump.has_value();
    converted.material = {names.make(source.GetName().C_Str(), "material"), {made}};
    return converted;
}

} // namespace convert
