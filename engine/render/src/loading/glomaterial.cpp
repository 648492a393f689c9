#include "glomaterial.h"

#include "orv/appearance.h"
#include "orv/assetcachepool.h"
#include "orv/propertycollector.h"
#include "orv/shaderprogramcache.h"
#include "orv/texture2d.h"
#include "orv/texturecube.h"
#include "orv/texturepropertyutil.h"

namespace orv::detail
{

using namespace glo;

namespace
{

bool isBuiltIn(const std::string& image)
{
    return image.compare(0, 4, "orv#") == 0 || image.compare(0, 7, "luvane#") == 0;
}

/// The sampler's settings, as far as they are valid and allowed for the texture's size.
void setParameters(Texture2D& texture, const Sampler& sampler)
{
    using FilterMode = TextureParameters::FilterMode;
    using WrapMode = TextureParameters::WrapMode;
    const bool powerOfTwo = isPowerOfTwo(texture.getWidth(), texture.getHeight());

    if (sampler.minFilter <= uint32_t(FilterMode::LINEAR_MIPMAP_LINEAR))
    {
        FilterMode filter = FilterMode(sampler.minFilter);
        if (isMipmapFilter(filter) && !texture.hasMipmaps() && !powerOfTwo)
            filter = filter <= FilterMode::NEAREST_MIPMAP_LINEAR ? FilterMode::NEAREST : FilterMode::LINEAR;
        texture.setMinFilter(filter);
    }
    if (sampler.magFilter <= uint32_t(FilterMode::LINEAR))
        texture.setMagFilter(FilterMode(sampler.magFilter));

    const auto allowed = [powerOfTwo](uint32_t mode) {
        return mode == uint32_t(WrapMode::CLAMP) ||
               (powerOfTwo && mode <= uint32_t(WrapMode::MIRRORED_REPEAT));
    };
    if (allowed(sampler.wrapHorizontal))
        texture.setHorizontalWrap(WrapMode(sampler.wrapHorizontal));
    if (allowed(sampler.wrapVertical))
        texture.setVerticalWrap(WrapMode(sampler.wrapVertical));
}

/// Copies the properties that a material may have.
class PropertyCopier : public PropertyCollector
{
public:
    explicit PropertyCopier(Appearance& target) : m_target(target) {}

    bool collect(const SharedPtr<ShaderUniformBase>& uniform, const char* name, int) override
    {
        copyIf<float>(*uniform, name);
        copyIf<Vector4f>(*uniform, name);
        copyIf<SharedPtr<Texture2D>>(*uniform, name);
        copyIf<SharedPtr<TextureCube>>(*uniform, name);
        return true;
    }

private:
    template <class T>
    void copyIf(const ShaderUniformBase& uniform, const char* name)
    {
        T value{};
        if (uniform.getValue(value, 0))
            m_target.setProperty<T>(name, value, 0);
    }

    Appearance& m_target;
};

} // namespace

GloMaterial::GloMaterial(AssetCachePool& pool, FileVersion version, AuthoringTool tool,
                         const std::string& name, const StandardMaterial& data)
    : m_pool(&pool)
    , m_version(version)
    , m_tool(tool)
    , m_name(name)
    , m_data(data)
{
    const SharedPtr<Appearance> appearance = makeShared<Appearance>();
    m_uses.push_back({false, appearance});
    if (!appearance)
        return;
    appearance->setName(name.c_str());
    setValues(*appearance);
}

SharedPtr<Appearance> GloMaterial::use(bool skinned)
{
    if (!m_used)
        m_uses.front().skinned = skinned;
    m_used = true;
    for (const Use& known : m_uses)
    {
        if (known.skinned == skinned)
            return known.appearance;
    }
    const SharedPtr<Appearance> copy = makeShared<Appearance>();
    if (!copy)
        return {};
    copy->setName(m_name.c_str());
    PropertyCopier copier(*copy);
    getAppearance()->collectProperties(&copier);
    return m_uses.emplace_back(Use{skinned, copy}).appearance;
}

void GloMaterial::forEachAppearance(
    const std::function<void(const SharedPtr<Appearance>&, bool skinned)>& use) const
{
    for (const Use& known : m_uses)
        use(known.appearance, known.skinned);
}

void GloMaterial::setValues(Appearance& appearance) const
{
    appearance.setProperty<Vector4f>("M_DIFFUSE_COLOUR", m_data.diffuse.colour, 0);
    appearance.setProperty<Vector4f>("M_AMBIENT_COLOUR", m_data.ambient.colour, 0);
    appearance.setProperty<Vector4f>("M_EMISSIVE_COLOUR", m_data.emissive.colour, 0);
    appearance.setProperty<Vector4f>("M_SPECULAR_COLOUR", m_data.specular.colour, 0);
    appearance.setProperty<float>("M_SHININESS", m_data.shininess, 0);
    appearance.setProperty<float>("M_SPECULAR_LEVEL", m_data.specularLevel, 0);
    appearance.setProperty<float>("M_OPACITY", m_data.opacity, 0);
    appearance.setProperty<float>("M_SELF_ILLUMINATION", m_data.selfIllumination, 0);
    if (m_data.features & surface::CUTOFF)
        appearance.setProperty<float>("M_CUTOFF", m_data.cutoff, 0);

    setTexture(appearance, "M_DIFFUSE_TEXTURE", m_data.diffuse.sampler, true);
    setTexture(appearance, "M_SPECULAR_TEXTURE", m_data.specular.sampler, true);
    setTexture(appearance, "M_AMBIENT_TEXTURE", m_data.ambient.sampler, true);
    setTexture(appearance, "M_EMISSIVE_TEXTURE", m_data.emissive.sampler, true);
    setTexture(appearance, "M_BUMP_TEXTURE", m_data.bump, false);
    setTexture(appearance, "M_REFLECTION_TEXTURE", m_data.reflection.sampler, false);
    setTexture(appearance, "M_REFRACTION_TEXTURE", m_data.refraction, false);
    setTexture(appearance, "M_FILTER_COLOUR_TEXTURE", m_data.filterColour, false);
    setTexture(appearance, "M_DISPLACEMENT_TEXTURE", m_data.displacement, false);
    setTexture(appearance, "M_GLOSS_TEXTURE", m_data.gloss, false);
    setTexture(appearance, "M_SPECULAR_LEVEL_TEXTURE", m_data.specularLevelMap, false);
}

void GloMaterial::setTexture(Appearance& appearance, const char* property, const SamplerField& field,
                             bool whiteWhenEmpty) const
{
    const Sampler sampler = field.value_or(Sampler());
    const bool found = applyTextureProperty(*m_pool, appearance, property, sampler.type,
                                            sampler.image.c_str(), whiteWhenEmpty);
    SharedPtr<Texture2D> texture;
    const SharedPtr<ShaderUniformBase>& uniform = appearance.getPropertyUniform(property);
    if (found && !isBuiltIn(sampler.image) && uniform && uniform->getValue(texture, 0) && texture)
        setParameters(*texture, sampler);
}

void GloMaterial::setState(Appearance& appearance) const
{
    if (isBlended(m_data))
        appearance.setBlendFactors(BlendFactor::SRC_ALPHA, BlendFactor::SRC_ALPHA_SATURATE,
                                   BlendFactor::ONE_MINUS_SRC_ALPHA, BlendFactor::ONE_MINUS_SRC_ALPHA);
    if (m_data.doubleSided != 0)
        appearance.setCullingMode(CullingMode::CULL_NONE);
}

void GloMaterial::choosePrograms()
{
    for (const Use& known : m_uses)
    {
        setState(*known.appearance);
        const std::string program = getProgramName(m_version, m_tool, m_name, m_data, known.skinned);
        known.appearance->setShaderProgram(m_pool->getShaderProgramCache()->get(program.c_str()));
    }
}

} // namespace orv::detail
