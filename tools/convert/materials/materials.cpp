#include "materials.h"

#include "highlights.h"
#include "materialvalues.h"
#include "samplers.h"
#include "sky.h"

#include "orv/detail/glomaterialrules.h"
#include "orv/texture.h"

#include <assimp/GltfMaterial.h>

#include <algorithm>
#include <cmath>

// docs/convert.md has the same in tables.

namespace convert
{

using orv::Vector4f;
using orv::detail::glo::isBlack;
namespace surface = glo::surface;
using Alpha = TextureWish::Alpha;

namespace
{

constexpr float ALMOST_OPAQUE = 0.999f;     // blended, but looks opaque
constexpr float ALMOST_BLACK = 1.0f / 4096; // invisible, but makes the diffuse picture's alpha count

const Vector4f BLACK(0.0f, 0.0f, 0.0f, 1.0f);
const Vector4f WHITE(1.0f, 1.0f, 1.0f, 1.0f);

const std::initializer_list<aiTextureType> BASE = {aiTextureType_DIFFUSE, aiTextureType_BASE_COLOR};
const std::initializer_list<aiTextureType> NORMALS = {aiTextureType_NORMALS, aiTextureType_NORMAL_CAMERA};
const std::initializer_list<aiTextureType> EMISSIVE = {aiTextureType_EMISSIVE, aiTextureType_EMISSION_COLOR};

/// glTF's alpha mode; empty for other formats.
std::string getAlphaMode(const aiMaterial& material)
{
    aiString mode;
    return material.Get(AI_MATKEY_GLTF_ALPHAMODE, mode) == aiReturn_SUCCESS ? mode.C_Str() : "";
}

/// Converts one material, feature by feature.
class MaterialConverter
{
public:
    MaterialConverter(const aiMaterial& source, const MaterialUse& use, TextureStore& textures,
                      Report& report)
        : m_source(source)
        , m_use(use)
        , m_samplers(source, findUvChannel(source), use.repeats, textures, report)
        , m_textures(textures)
        , m_report(report)
        , m_alphaMode(getAlphaMode(source))
        , m_isGltf(!m_alphaMode.empty())
        , m_isLinear(use.linear.empty() ? m_isGltf : use.linear == "on")
    {
    }

    glo::StandardMaterial convert()
    {
        setBase();
        setEmission();
        setHighlight();
        setNormals();
        setOcclusion();
        m_made.doubleSided = getInt(m_source, AI_MATKEY_TWOSIDED) != 0;
        addFeature(m_use.hasColours, surface::VERTEX_COLOUR);
        if (isUnlit())
            makeUnlit();
        else
        {
            addFeature(m_made.doubleSided && !m_made.bump, surface::BACK); // bump mapping has it anyway
            addFeature(m_isLinear && isLit(), surface::LINEAR);
        }
        reportUnused();
        return m_made;
    }

private:
    void addFeature(bool isWanted, uint32_t feature) { m_made.features |= isWanted ? feature : 0; }

    void setBase()
    {
        const Vector4f usual = m_isGltf ? WHITE : Vector4f(0.6f, 0.6f, 0.6f, 1.0f);
        Vector4f colour =
            getColour(m_source, AI_MATKEY_COLOR_DIFFUSE, getColour(m_source, AI_MATKEY_BASE_COLOR, usual));
        const float opacity = getOpacity(colour.w);
        const MadeSampler picture = m_samplers.make(BASE, wishBase(colour.w));
        if (picture.field && !m_isGltf && isBlack(colour))
            colour = WHITE; // black would hide the picture
        if (m_use.hasColours && isMadeUp())
            colour = WHITE; // instead of the library's grey
        if (m_isGltf)
            colour = toScreen(colour);
        colour.w = 1.0f;
        m_made.diffuse = {colour, picture.field};
        m_made.ambient.colour = colour; // for lights with an ambient level
        const bool isCutOut = isMask() ? picture.hasAlpha || m_use.hasColours || m_threshold > 1.0f
                                       : picture.isAllOrNothing && opacity == 1.0f;
        addFeature(isCutOut, surface::CUTOFF);
        m_made.cutoff = isMask() ? m_threshold : 0.5f;
        m_made.opacity = picture.hasAlpha && !isCutOut ? std::min(opacity, ALMOST_OPAQUE) : opacity;
    }

    /// The library makes a material for a file that has none.
    bool isMadeUp() const
    {
        const aiString name = m_source.GetName();
        return !m_isGltf && (name.length == 0 || name == aiString(AI_DEFAULT_MATERIAL_NAME));
    }

    bool isUnlit() const
    {
        return getInt(m_source, AI_MATKEY_SHADING_MODEL) == aiShadingMode_NoShading ||
               (m_use.hasColours && !m_use.isSurface);
    }

    bool isMask() const { return m_alphaMode == "MASK"; }

    /// For the whole surface.
    /// @param alpha  of the base colour.
    float getOpacity(float alpha)
    {
        if (m_isGltf)
            return m_alphaMode == "BLEND" ? std::clamp(alpha, 0.0f, ALMOST_OPAQUE) : 1.0f;
        const float opacity = getFloat(m_source, AI_MATKEY_OPACITY, 1.0f);
        if (opacity > 0.0f)
            return std::min(opacity, 1.0f);
        m_report.approximate("opacity-zero",
                             "an opacity of 0, which some programs write for opaque (opaque)");
        return 1.0f;
    }

    /// How the alpha of the base picture is meant.
    /// @param alpha  of the base colour.
    TextureWish wishBase(float alpha)
    {
        TextureWish wish;
        if (isMask())
        {
            m_threshold = getFloat(m_source, AI_MATKEY_GLTF_ALPHACUTOFF, 0.5f) / std::max(alpha, 1e-3f);
            wish.alpha = Alpha::CUT;
            wish.threshold = m_use.hasColours ? 1.0f : m_threshold; // vertex alpha is multiplied later
            return wish;
        }
        if (m_isGltf)
        {
            wish.alpha = m_alphaMode == "BLEND" ? Alpha::KEEP : Alpha::DROP;
            return wish;
        }
        const int flags = getInt(m_source, AI_MATKEY_TEXFLAGS_DIFFUSE(0));
        wish.alpha = flags & aiTextureFlags_IgnoreAlpha ? Alpha::DROP
                     : flags & aiTextureFlags_UseAlpha  ? Alpha::KEEP
                                                        : Alpha::AUTO;
        addOpacityMap(wish);
        return wish;
    }

    /// A picture whose brightness is the opacity, or which is the base picture with its alpha.
    void addOpacityMap(TextureWish& wish)
    {
        const std::string map = getTexturePath(m_source, aiTextureType_OPACITY);
        const std::string base = getTexturePath(m_source, findTextureType(m_source, BASE));
        if (map.empty())
            return;
        if (base.empty())
            m_report.lose("opacity-map", "an opacity map on a surface without another picture");
        wish.alpha = Alpha::KEEP;
        if (map != base)
            wish.opacity = map;
    }

    void setEmission()
    {
        Vector4f colour = getColour(m_source, AI_MATKEY_COLOR_EMISSIVE, BLACK);
        if (m_isGltf)
            colour = toScreen(colour);
        m_made.emissive.sampler = m_samplers.make(EMISSIVE).field;
        if (m_made.emissive.sampler && !m_isGltf && isBlack(colour))
            colour = WHITE;
        else if (!m_made.emissive.sampler && !m_isGltf && !isBlack(colour))
            m_made.emissive.sampler = m_made.diffuse.sampler; // in the engine it multiplies all light
        colour.w = 1.0f;
        m_made.emissive.colour = colour;
    }

    void setHighlight()
    {
        Highlight highlight;
        if (hasFloat(m_source, AI_MATKEY_GLOSSINESS_FACTOR))
            highlight = getGlossHighlight();
        // Roughness tells nothing: Phong materials of FBX have it, too.
        else if (hasFloat(m_source, AI_MATKEY_METALLIC_FACTOR) ||
                 findTextureType(m_source, {aiTextureType_METALNESS, aiTextureType_DIFFUSE_ROUGHNESS}) !=
                     aiTextureType_NONE)
            highlight = getMetalHighlight();
        else
            highlight = getClassicHighlight();
        m_made.specular.colour = highlight.colour;
        m_made.specularLevel = highlight.level;
        m_made.shininess = highlight.shininess;
    }

    Highlight getMetalHighlight()
    {
        const aiTextureType metal =
            findTextureType(m_source, {aiTextureType_METALNESS, aiTextureType_UNKNOWN});
        const aiTextureType rough =
            findTextureType(m_source, {aiTextureType_DIFFUSE_ROUGHNESS, aiTextureType_UNKNOWN});
        // Maps are multiplied with the factors in glTF, and take their place elsewhere.
        float metalness = m_isGltf || metal != aiTextureType_NONE ? 1.0f : 0.0f;
        float roughness = 1.0f;
        if (m_isGltf || metal == aiTextureType_NONE)
            metalness = getFloat(m_source, AI_MATKEY_METALLIC_FACTOR, metalness);
        if (m_isGltf || rough == aiTextureType_NONE)
            roughness = getFloat(m_source, AI_MATKEY_ROUGHNESS_FACTOR, roughness);
        metalness *= getMapMean(metal).z;
        const Vector4f base = m_made.diffuse.colour;
        roughness *= getMapMean(rough).y;
        const bool hasSky = m_use.sky && metalness >= 0.5f && !isUnlit();
        if ((m_isLinear || hasSky) && !isUnlit())
            dimMetal(metalness, roughness, hasSky ? 1.0f : 0.5f);
        Highlight highlight = fromMetalness(base, metalness, roughness, getMirrored());
        if (hasSky)
            mirrorSky(metalness, roughness, highlight);
        return highlight;
    }

    /// A metal mirrors the light that it does not scatter, see dimMetal().
    void mirrorSky(float metalness, float roughness, Highlight& highlight)
    {
        using orv::TextureParameters;
        glo::Sampler sampler;
        sampler.type = orv::detail::glo::sampler::TEXTURE_CUBE;
        sampler.minFilter = sampler.magFilter = uint32_t(TextureParameters::FilterMode::LINEAR);
        sampler.wrapHorizontal = sampler.wrapVertical = uint32_t(TextureParameters::WrapMode::CLAMP);
        sampler.image = m_textures.addMade("sky", makeSky);
        m_made.reflection.sampler = sampler;
        m_made.specular.sampler = m_made.diffuse.sampler; // tints a metal's reflection
        highlight.level = std::lerp(highlight.level, getSmoothness(roughness), std::min(metalness, 1.0f));
    }

    /// The specular reflectance of a non-metal, relative to the usual one.
    Vector4f getMirrored() const
    {
        if (!m_isGltf || !hasFloat(m_source, AI_MATKEY_SPECULAR_FACTOR))
            return WHITE;
        const float strength = getFloat(m_source, AI_MATKEY_SPECULAR_FACTOR, 1.0f);
        const Vector4f colour = getColour(m_source, AI_MATKEY_COLOR_SPECULAR, WHITE);
        const auto limit = [strength](float share) { return std::clamp(share * strength, 0.0f, 1.0f); };
        return toScreen(Vector4f(limit(colour.x), limit(colour.y), limit(colour.z), 1.0f));
    }

    bool isLit() const
    {
        return !isBlack(m_made.diffuse.colour) ||
               (m_made.specularLevel > 0.0f && !isBlack(m_made.specular.colour));
    }

    static float getSmoothness(float roughness)
    {
        return 1.0f - std::clamp(roughness * roughness, 0.0f, 1.0f);
    }

    /// The diffuse light that metals show instead of their surroundings. On a whole ball, half of it in linear light is
    /// as bright as all of it in sRGB values. Rough metals scatter more light, like other surfaces.
    /// @param most  the share of light that a smooth one loses.
    void dimMetal(float metalness, float roughness, float most)
    {
        constexpr float LEAST = 0.15f; // the share that a rough one loses, compared with three.js
        const float lost = std::lerp(LEAST, most, getSmoothness(roughness));
        const float share = 1.0f - lost * std::clamp(metalness, 0.0f, 1.0f);
        const float shown = toScreen(Vector4f(share, share, share, 1.0f)).x;
        for (Vector4f* colour : {&m_made.diffuse.colour, &m_made.ambient.colour})
            *colour = Vector4f(colour->x * shown, colour->y * shown, colour->z * shown, 1.0f);
    }

    /// Mean colour of a map that the engine cannot use as a picture; white if there is none.
    Vector4f getMapMean(aiTextureType type)
    {
        if (type == aiTextureType_NONE)
            return WHITE;
        m_report.approximate("surface-map", "a map of roughness, metalness or gloss (its mean instead)");
        return m_textures.getMean(getTexturePath(m_source, type)).value_or(WHITE);
    }

    /// The map's colour becomes a picture; its alpha is gloss.
    Highlight getGlossHighlight()
    {
        const Vector4f specular = getColour(m_source, AI_MATKEY_COLOR_SPECULAR, WHITE);
        const float glossiness = getFloat(m_source, AI_MATKEY_GLOSSINESS_FACTOR, 1.0f);
        m_made.specular.sampler = m_samplers.make({aiTextureType_SPECULAR}).field;
        if (!m_made.specular.sampler)
            return fromGlossiness(specular, glossiness);
        Highlight highlight = fromGlossiness(WHITE, glossiness * getMapMean(aiTextureType_SPECULAR).w);
        highlight.colour = specular;
        return highlight;
    }

    Highlight getClassicHighlight()
    {
        Vector4f colour = getColour(m_source, AI_MATKEY_COLOR_SPECULAR, BLACK);
        m_made.specular.sampler = m_samplers.make({aiTextureType_SPECULAR}).field;
        if (m_made.specular.sampler && isBlack(colour))
            colour = WHITE;
        colour.w = 1.0f;
        const int model = getInt(m_source, AI_MATKEY_SHADING_MODEL);
        if (model == aiShadingMode_Gouraud || model == aiShadingMode_Flat)
            return {};
        m_made.gloss = m_samplers.make({aiTextureType_SHININESS}).field;
        return fromShininess(colour, getFloat(m_source, AI_MATKEY_SHININESS_STRENGTH, 1.0f),
                             getFloat(m_source, AI_MATKEY_SHININESS, 0.0f));
    }

    void setNormals()
    {
        m_made.bump = m_samplers.make(NORMALS).field;
        TextureWish heights;
        heights.isHeight = true;
        if (!m_made.bump)
            m_made.bump = m_samplers.make({aiTextureType_HEIGHT}, heights).field;
        const float strength =
            getFloat(m_source, AI_MATKEY_GLTF_TEXTURE_SCALE(aiTextureType_NORMALS, 0), 1.0f);
        if (m_made.bump && strength != 1.0f)
            m_report.approximate("normal-strength", "the strength of a normal map (1 instead)");
        if (m_made.gloss && !m_made.bump)
            m_report.approximate("gloss-map", "a gloss map (visible only with a normal map)");
    }

    /// Ambient occlusion. In other formats such a map may also be a light map.
    void setOcclusion()
    {
        if (!m_isGltf || isUnlit())
            return;
        const float strength =
            getFloat(m_source, AI_MATKEY_GLTF_TEXTURE_STRENGTH(aiTextureType_LIGHTMAP, 0), 1.0f);
        TextureWish wish;
        wish.alpha = Alpha::DROP;
        wish.occlusion = std::clamp(strength, 0.0f, 1.0f);
        wish.isShare = m_isLinear;
        m_made.ambient.sampler = m_samplers.make({aiTextureType_LIGHTMAP}, wish).field;
    }

    /// The base colour becomes emission, which does not depend on lights.
    void makeUnlit()
    {
        const bool hasOwnLight = m_made.emissive.sampler || !isBlack(m_made.emissive.colour);
        if (m_made.features != 0 && (m_isGltf || !hasOwnLight))
        {
            m_made.features |= surface::UNLIT; // works with vertex colours and cut-outs
            m_made.emissive = {};
            addFeature(m_isLinear && m_use.hasColours, surface::LINEAR); // for interpolation between vertices
        }
        else
            makeGlow(hasOwnLight);
        m_made.ambient = {};
        m_made.specular = {};
        m_made.specularLevel = 0.0f;
        m_made.bump.reset();
        m_made.gloss.reset();
    }

    /// Values that older readers use too.
    void makeGlow(bool hasOwnLight)
    {
        if (m_isGltf || !hasOwnLight)
            m_made.emissive = m_made.diffuse;
        const bool blends = orv::detail::glo::isBlended(m_made);
        const float left = blends && m_made.diffuse.sampler ? ALMOST_BLACK : 0.0f;
        m_made.diffuse.colour = Vector4f(left, left, left, 1.0f);
        if (left == 0.0f)
            m_made.diffuse.sampler.reset();
    }

    void reportUnused()
    {
        const struct
        {
            aiTextureType type;
            const char* code;
            const char* loss;
        } kinds[] = {
            {aiTextureType_REFLECTION, "reflection-map", "a map of what a surface reflects"},
            {aiTextureType_LIGHTMAP, "light-map", "a map of light or of its absence"},
            {aiTextureType_AMBIENT_OCCLUSION, "light-map", "a map of light or of its absence"},
            {aiTextureType_DISPLACEMENT, "displacement-map", "a map that moves the surface"},
            {aiTextureType_SHEEN, "sheen", "a sheen"},
            {aiTextureType_CLEARCOAT, "clear-coat", "a clear coat"},
            {aiTextureType_TRANSMISSION, "transmission", "the transmission of a surface"},
        };
        const std::string base = getTexturePath(m_source, findTextureType(m_source, BASE));
        for (const auto& kind : kinds)
        {
            const std::string path = getTexturePath(m_source, kind.type);
            const bool isUsed = kind.type == aiTextureType_LIGHTMAP && m_isGltf;
            if (!path.empty() && path != base && !isUsed)
                m_report.lose(kind.code, kind.loss);
        }
        if (getFloat(m_source, AI_MATKEY_CLEARCOAT_FACTOR, 0.0f) > 0.0f)
            m_report.lose("clear-coat", "a clear coat");
        if (getFloat(m_source, AI_MATKEY_TRANSMISSION_FACTOR, 0.0f) > 0.0f)
            m_report.lose("transmission", "the transmission of a surface");
        if (getInt(m_source, AI_MATKEY_BLEND_FUNC) == aiBlendMode_Additive)
            m_report.approximate("additive-blending", "additive blending (ordinary blending instead)");
    }

    const aiMaterial& m_source;
    const MaterialUse& m_use;
    SamplerMaker m_samplers;
    TextureStore& m_textures;
    Report& m_report;
    std::string m_alphaMode;
    bool m_isGltf;
    bool m_isLinear;
    float m_threshold = 0.5f; ///< of MASK, for the picture's alpha
    glo::StandardMaterial m_made;
};

} // namespace

aiTextureType findMainTexture(const aiMaterial& material)
{
    return findTextureType(material,
                           {aiTextureType_DIFFUSE, aiTextureType_BASE_COLOR, aiTextureType_NORMALS,
                            aiTextureType_NORMAL_CAMERA, aiTextureType_HEIGHT, aiTextureType_EMISSIVE,
                            aiTextureType_EMISSION_COLOR, aiTextureType_SPECULAR});
}

unsigned findUvChannel(const aiMaterial& material)
{
    const aiTextureType type = findMainTexture(material);
    aiString path;
    unsigned channel = 0;
    if (type != aiTextureType_NONE)
        material.GetTexture(type, 0, &path, nullptr, &channel);
    return channel;
}

ConvertedMaterial convertMaterial(const aiMaterial& source, const MaterialUse& use, TextureStore& textures,
                                  NameMaker& names, Report& report)
{
    const glo::StandardMaterial made = MaterialConverter(source, use, textures, report).convert();
    const std::string alphaMode = getAlphaMode(source);
    ConvertedMaterial converted;
    converted.hasLightColours = !alphaMode.empty();
    converted.usesVertexAlpha = alphaMode == "BLEND" || alphaMode == "MASK";
    converted.uvChannel = findUvChannel(source);
    converted.hasNormalMap = made.bump.has_value();
    converted.material = {names.make(source.GetName().C_Str(), "material"), {made}};
    return converted;
}

} // namespace convert
