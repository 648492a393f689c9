#include "materials.h"

#include <assimp/GltfMaterial.h>
#include <assimp/material.h>
#include <assimp/mesh.h>
#include <assimp/texture.h>

#include <array>
#include <cmath>

namespace convert::gltf
{

namespace
{

/// A kind of picture, by libassimp's names; the first one has the settings.
using Kinds = std::initializer_list<aiTextureType>;

int toMapMode(size_t wrap)
{
    constexpr size_t CLAMP = 33071;
    constexpr size_t MIRROR = 33648;
    return wrap == CLAMP    ? aiTextureMapMode_Clamp
           : wrap == MIRROR ? aiTextureMapMode_Mirror
                            : aiTextureMapMode_Wrap;
}

UvPlacing readPlacing(const Object& info)
{
    UvPlacing placing;
    placing.channel = unsigned(std::min<size_t>(info.size("texCoord", 0), AI_MAX_NUMBER_OF_TEXTURECOORDS));
    const Object transform = info.extension("KHR_texture_transform");
    if (!transform)
        return placing;
    placing.channel = unsigned(
        std::min<size_t>(transform.size("texCoord", placing.channel), AI_MAX_NUMBER_OF_TEXTURECOORDS));
    std::array<float, 2> pair{};
    if (transform.numbers("offset", pair))
        placing.offset = aiVector2D(pair[0], pair[1]);
    if (transform.numbers("scale", pair))
        placing.scale = aiVector2D(pair[0], pair[1]);
    placing.rotation = float(transform.number("rotation", 0.0));
    return placing;
}

class MaterialReader
{
public:
    MaterialReader(Source& source, Textures& textures, const Object& material)
        : m_source(source)
        , m_textures(textures)
        , m_object(material)
        , m_made(std::make_unique<aiMaterial>())
    {
    }

    ReadMaterial read()
    {
        add(aiString(getName(m_object)), AI_MATKEY_NAME);
        const Object gloss = m_object.extension("KHR_materials_pbrSpecularGlossiness");
        if (gloss)
            readGloss(gloss);
        else
            readMetal(m_object.object("pbrMetallicRoughness"));
        readCommon();
        readSpecular();
        const bool isUnlit = bool(m_object.extension("KHR_materials_unlit"));
        add(int(isUnlit ? aiShadingMode_NoShading : aiShadingMode_PBR_BRDF), AI_MATKEY_SHADING_MODEL);
        reportOthers();
        return {std::move(m_made), m_main.value_or(UvPlacing())};
    }

private:
    void add(const aiString& value, const char* key, unsigned type, unsigned index)
    {
        m_made->AddProperty(&value, key, type, index);
    }

    template <class T>
    void add(const T& value, const char* key, unsigned type, unsigned index)
    {
        m_made->AddProperty(&value, 1, key, type, index);
    }

    static aiColor4D readColour4(const Object& object, const char* key)
    {
        std::array<float, 4> c = {1.0f, 1.0f, 1.0f, 1.0f};
        object.numbers(key, c);
        return {c[0], c[1], c[2], c[3]};
    }

    static aiColor3D readColour3(const Object& object, const char* key, float usual)
    {
        std::array<float, 3> c = {usual, usual, usual};
        object.numbers(key, c);
        return {c[0], c[1], c[2]};
    }

    void setBase(const aiColor4D& colour, const Object& info)
    {
        add(colour, AI_MATKEY_COLOR_DIFFUSE);
        add(colour, AI_MATKEY_BASE_COLOR);
        add(colour.a, AI_MATKEY_OPACITY);
        addTexture(info, {aiTextureType_DIFFUSE, aiTextureType_BASE_COLOR});
    }

    void readMetal(const Object& metal)
    {
        setBase(readColour4(metal, "baseColorFactor"), metal.object("baseColorTexture"));
        add(float(metal.number("metallicFactor", 1.0)), AI_MATKEY_METALLIC_FACTOR);
        add(float(metal.number("roughnessFactor", 1.0)), AI_MATKEY_ROUGHNESS_FACTOR);
        m_isMean = true;
        addTexture(metal.object("metallicRoughnessTexture"),
                   {aiTextureType_METALNESS, aiTextureType_DIFFUSE_ROUGHNESS});
        m_isMean = false;
    }

    void readGloss(const Object& gloss)
    {
        setBase(readColour4(gloss, "diffuseFactor"), gloss.object("diffuseTexture"));
        add(readColour3(gloss, "specularFactor", 1.0f), AI_MATKEY_COLOR_SPECULAR);
        add(float(gloss.number("glossinessFactor", 1.0)), AI_MATKEY_GLOSSINESS_FACTOR);
        addTexture(gloss.object("specularGlossinessTexture"), {aiTextureType_SPECULAR});
    }

    void readCommon()
    {
        const Object normal = m_object.object("normalTexture");
        addTexture(normal, {aiTextureType_NORMALS});
        if (normal)
            add(float(normal.number("scale", 1.0)), AI_MATKEY_GLTF_TEXTURE_SCALE(aiTextureType_NORMALS, 0));
        const double strength =
            m_object.extension("KHR_materials_emissive_strength").number("emissiveStrength", 1.0);
        add(readColour3(m_object, "emissiveFactor", 0.0f) * float(strength), AI_MATKEY_COLOR_EMISSIVE);
        addTexture(m_object.object("emissiveTexture"), {aiTextureType_EMISSIVE});
        addOcclusion(m_object.object("occlusionTexture"));
        add(int(m_object.flag("doubleSided")), AI_MATKEY_TWOSIDED);
        const std::string mode = m_object.text("alphaMode");
        add(aiString(mode == "MASK" || mode == "BLEND" ? mode : "OPAQUE"), AI_MATKEY_GLTF_ALPHAMODE);
        add(float(m_object.number("alphaCutoff", 0.5)), AI_MATKEY_GLTF_ALPHACUTOFF);
    }

    /// Often made for other texture coordinates: it would be wrong with those of the other pictures.
    void addOcclusion(const Object& occlusion)
    {
        if (!occlusion)
            return;
        if (!(readPlacing(occlusion) == m_main.value_or(UvPlacing())))
            return m_source.report.lose("light-map", "an occlusion map with its own coordinates");
        addTexture(occlusion, {aiTextureType_LIGHTMAP});
        add(float(occlusion.number("strength", 1.0)),
            AI_MATKEY_GLTF_TEXTURE_STRENGTH(aiTextureType_LIGHTMAP, 0));
    }

    /// Specular reflection of non-metals: strength, including the index of refraction, and colour.
    void readSpecular()
    {
        constexpr double USUAL = 0.04;
        const Object specular = m_object.extension("KHR_materials_specular");
        const double index = m_object.extension("KHR_materials_ior").number("ior", 1.5);
        const double mirrored =
            index > 0.0 ? (index - 1.0) * (index - 1.0) / ((index + 1.0) * (index + 1.0)) : 1.0;
        const double strength = specular.number("specularFactor", 1.0) * mirrored / USUAL;
        if (!specular && index == 1.5)
            return;
        add(float(strength), AI_MATKEY_SPECULAR_FACTOR);
        add(readColour3(specular, "specularColorFactor", 1.0f), AI_MATKEY_COLOR_SPECULAR);
        for (const char* map : {"specularTexture", "specularColorTexture"})
        {
            if (specular.has(map))
                m_source.report.lose("specular-map", "a map of a surface's reflectance");
        }
    }

    void addTexture(const Object& info, Kinds kinds)
    {
        if (!info)
            return;
        if (!info.has("index"))
            info.fail("has no index");
        const Object texture = m_source.document.find("textures", info, "index");
        const std::string path = m_textures.getPath(texture);
        if (path.empty())
            return;
        const UvPlacing placing = readPlacing(info);
        for (const aiTextureType type : kinds)
        {
            add(aiString(path), AI_MATKEY_TEXTURE(type, 0));
            add(int(placing.channel), AI_MATKEY_UVWSRC(type, 0));
            addSampler(m_source.document.find("samplers", texture, "sampler"), type);
        }
        if (!m_isMean)
            notePlacing(placing);
    }

    /// All pictures share one transform; a different channel is reported by the sampler's code.
    void notePlacing(const UvPlacing& placing)
    {
        if (!m_main)
            m_main = placing;
        else if (placing.channel == m_main->channel && !(placing == *m_main))
            m_source.report.lose("texture-uv-set",
                                 "a texture's own transform (it has that of the material's first)");
    }

    void addSampler(const Object& sampler, aiTextureType type)
    {
        constexpr size_t REPEAT = 10497;
        add(toMapMode(sampler.size("wrapS", REPEAT)), AI_MATKEY_MAPPINGMODE_U(type, 0));
        add(toMapMode(sampler.size("wrapT", REPEAT)), AI_MATKEY_MAPPINGMODE_V(type, 0));
        if (sampler.has("magFilter"))
            add(int(std::min<size_t>(sampler.size("magFilter", 0), 0xffff)),
                AI_MATKEY_GLTF_MAPPINGFILTER_MAG(type, 0));
        if (sampler.has("minFilter"))
            add(int(std::min<size_t>(sampler.size("minFilter", 0), 0xffff)),
                AI_MATKEY_GLTF_MAPPINGFILTER_MIN(type, 0));
    }

    void reportOthers()
    {
        const Object coat = m_object.extension("KHR_materials_clearcoat");
        add(float(coat.number("clearcoatFactor", 0.0)), AI_MATKEY_CLEARCOAT_FACTOR);
        const Object transmission = m_object.extension("KHR_materials_transmission");
        add(float(transmission.number("transmissionFactor", 0.0)), AI_MATKEY_TRANSMISSION_FACTOR);
        if (m_object.extension("KHR_materials_sheen"))
            m_source.report.lose("sheen", "a sheen");
        const struct
        {
            const char* extension;
            const char* factor; ///< the picture has no effect if it is 0
        } others[] = {{"KHR_materials_iridescence", "iridescenceFactor"},
                      {"KHR_materials_anisotropy", "anisotropyStrength"},
                      {"KHR_materials_volume", "thicknessFactor"},
                      {"KHR_materials_dispersion", "dispersion"},
                      {"KHR_materials_diffuse_transmission", "diffuseTransmissionFactor"}};
        for (const auto& other : others)
        {
            if (m_object.extension(other.extension).number(other.factor, 0.0) != 0.0)
                m_source.report.lose("material-extension",
                                     "what " + std::string(other.extension) + " adds to a material");
        }
    }

    Source& m_source;
    Textures& m_textures;
    const Object& m_object;
    std::unique_ptr<aiMaterial> m_made;
    std::optional<UvPlacing> m_main;
    bool m_isMean = false; ///< only the picture's mean is used, so its transform is irrelevant
};

} // namespace

bool UvPlacing::operator==(const UvPlacing& other) const
{
    return channel == other.channel && offset == other.offset && scale == other.scale &&
           rotation == other.rotation;
}

bool UvPlacing::movesNothing() const
{
    UvPlacing usual;
    usual.channel = channel;
    return *this == usual;
}

aiVector2D UvPlacing::apply(const aiVector2D& uv) const
{
    const float cosine = std::cos(rotation);
    const float sine = std::sin(rotation);
    const float u = uv.x * scale.x;
    const float v = uv.y * scale.y;
    return {offset.x + cosine * u + sine * v, offset.y - sine * u + cosine * v};
}

ReadMaterial readMaterial(Source& source, Textures& textures, const Object& material)
{
    return MaterialReader(source, textures, material).read();
}

} // namespace convert::gltf
