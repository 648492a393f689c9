#include "rendererproperties.h"

#include "orv/assetcachepool.h"
#include "orv/mesh.h"
#include "orv/solid.h"
#include "orv/texture2dcache.h"

#include <algorithm>

namespace orv::detail
{

namespace
{

/// Defaults for material values; an appearance's own values override them.
template <class T>
struct MaterialDefault
{
    const char* name;
    T value;
};

constexpr MaterialDefault<Vector4f> VECTOR_DEFAULTS[] = {
    {"M_DIFFUSE_COLOUR", Vector4f(1.0f, 1.0f, 1.0f, 1.0f)},
    {"M_AMBIENT_COLOUR", Vector4f(0.0f, 0.0f, 0.0f, 1.0f)},
    {"M_SPECULAR_COLOUR", Vector4f(1.0f, 1.0f, 1.0f, 1.0f)},
    {"M_EMISSIVE_COLOUR", Vector4f(0.0f, 0.0f, 0.0f, 1.0f)},
    {"M_UV_OFFSET_SCALE", Vector4f(0.0f, 0.0f, 1.0f, 1.0f)},
};

/// Values of the luvane# effects, for which zero is a meaningful default.
constexpr const char* ZERO_VECTORS[] = {"M_BLUR_STEP", "M_DEPTH_RANGE", "M_FADE", "M_FOCUS",
                                        "M_WEATHER_FALL"};

constexpr MaterialDefault<float> FLOAT_DEFAULTS[] = {
    {"M_SHININESS", 5.0f},         {"M_SPECULAR_LEVEL", 1.0f},  {"M_OPACITY", 1.0f},
    {"M_SELF_ILLUMINATION", 0.0f}, {"M_WEATHER_STRETCH", 1.0f}, {"M_CUTOFF", 0.5f},
};

constexpr MaterialDefault<const char*> TEXTURES[] = {
    {"M_BLACK_TEXTURE", "orv#black.png"},          {"M_WHITE_TEXTURE", "orv#white.png"},
    {"M_ERROR_TEXTURE", "orv#error.png"},          {"M_DIFFUSE_TEXTURE", "orv#white.png"},
    {"M_SPECULAR_TEXTURE", "orv#white.png"},       {"M_AMBIENT_TEXTURE", "orv#white.png"},
    {"M_EMISSIVE_TEXTURE", "orv#white.png"},       {"M_GLOSS_TEXTURE", "orv#white.png"},
    {"M_SPECULAR_LEVEL_TEXTURE", "orv#white.png"}, {"M_REFLECTION_TEXTURE", "orv#black.png"},
    {"M_BLURRED_TEXTURE", "orv#white.png"},        {"M_DEPTH_TEXTURE", "orv#white.png"},
};

constexpr const char* BUMP_TEXTURE = "M_BUMP_TEXTURE";

/// One texel of a surface without bumps.
SharedPtr<Texture2D> createFlatTexture(AssetCachePool& pool)
{
    const unsigned char pixel[] = {128, 128, 255};
    return pool.getTexture2DCache()->create(1, 1, Texture::Format::RGB, Texture::Type::UNSIGNED_BYTE, pixel,
                                            nullptr);
}

} // namespace

JointProperties::JointProperties(RenderContext& context)
    : count(shareProperty<int>(context, "J_COUNT", 1, 0))
    , world(shareProperty(context, "J_WORLD", Solid::MAX_JOINTS, Matrix4f()))
    , weightFilled(shareProperty(context, "J_WEIGHT_FILLED", 1, 0.0f))
{
}

void JointProperties::publish(const Solid& solid) const
{
    const int jointCount = std::min(solid.getJointCount(), Solid::MAX_JOINTS);
    count->set(jointCount);
    for (int i = 0; i < jointCount; ++i)
        world->set(solid.getJointTransform(i), i);
    const VertexBuffer* vertices = solid.getMesh() ? solid.getMesh()->getVertexBuffer().get() : nullptr;
    weightFilled->set(vertices && vertices->lacksLastWeight() ? 1.0f : 0.0f);
}

RendererProperties::RendererProperties(RenderContext& context, AssetCachePool* pool)
    : lightCount(shareProperty<int>(context, "L_COUNT", 1, 0))
    , lightDiffuse(shareProperty(context, "L_DIFFUSE_COLOUR", MAX_LIGHTS, Vector4f()))
    , lightAmbient(shareProperty(context, "L_AMBIENT_COLOUR", MAX_LIGHTS, Vector4f()))
    , lightSpecular(shareProperty(context, "L_SPECULAR_COLOUR", MAX_LIGHTS, Vector4f()))
    , lightPosition(shareProperty(context, "L_POSITION", MAX_LIGHTS, Vector4f()))
    , lightAttenuationNear(shareProperty(context, "L_ATTENUATION_NEAR", MAX_LIGHTS, 0.0f))
    , lightAttenuationReciprocal(shareProperty(context, "L_ATTENUATION_RECIPROCAL", MAX_LIGHTS, 0.0f))
    , lightSpotInnerCos(shareProperty(context, "L_SPOT_INNER_COS", MAX_LIGHTS, 0.0f))
    , lightSpotOuterCos(shareProperty(context, "L_SPOT_OUTER_COS", MAX_LIGHTS, 0.0f))
    , lightSpotDirection(shareProperty(context, "L_SPOT_DIRECTION", MAX_LIGHTS, Vector3f()))
    , joints(context)
    , model(shareProperty<Matrix4f>(context, "T_MODEL", 1, Matrix4f::IDENTITY))
    , view(shareProperty<Matrix4f>(context, "T_VIEW", 1, Matrix4f::IDENTITY))
    , modelView(shareProperty<Matrix4f>(context, "T_MODEL_VIEW", 1, Matrix4f::IDENTITY))
    , viewProjection(shareProperty<Matrix4f>(context, "T_VIEW_PROJECTION", 1, Matrix4f::IDENTITY))
    , modelViewProjection(shareProperty<Matrix4f>(context, "T_MODEL_VIEW_PROJECTION", 1, Matrix4f::IDENTITY))
    , normalModel(shareProperty<Matrix3f>(context, "T_NORMAL_MODEL", 1, Matrix3f::IDENTITY))
    , cameraPosition(shareProperty(context, "T_CAMERA_POSITION", 1, Vector4f(0.0f, 0.0f, 0.0f, 1.0f)))
    , time(shareProperty(context, "TIME", 1, 0.0f))
{
    markTransforms();
    shareProperty(context, "FOG_DENSITY", 1, 0.0f);
    m_sharers = shareProperty<int>(context, "SIMPLE_RENDERER", 1, 0); // after the marks: programs see them
    shareProperty(context, "FOG_COLOUR", 1, Vector4f(0.0f, 0.0f, 0.0f, 1.0f));

    for (const MaterialDefault<Vector4f>& value : VECTOR_DEFAULTS)
    {
        if (!context.getProperty(value.name))
            shareProperty(context, value.name, 1, value.value);
    }
    for (const char* name : ZERO_VECTORS)
    {
        if (!context.getProperty(name))
            shareProperty(context, name, 1, Vector2f(0.0f, 0.0f));
    }
    for (const MaterialDefault<float>& value : FLOAT_DEFAULTS)
    {
        if (!context.getProperty(value.name))
            shareProperty(context, value.name, 1, value.value);
    }
    for (const MaterialDefault<const char*>& texture : TEXTURES)
        provideTexture(context, pool, texture.name, texture.value);
    provideTexture(context, pool, BUMP_TEXTURE, nullptr);
}

/// Does nothing unless all could be allocated: then nothing is drawn.
void RendererProperties::markTransforms()
{
    if (!isComplete())
        return;
    model->setDrawTransform(DrawTransform::MODEL);
    modelView->setDrawTransform(DrawTransform::MODEL_VIEW);
    modelViewProjection->setDrawTransform(DrawTransform::MODEL_VIEW_PROJECTION);
    normalModel->setDrawTransform(DrawTransform::NORMAL_MODEL);
}

RendererProperties::~RendererProperties()
{
    const bool othersRemain = m_sharers && m_sharers->sharedGetCount() > 2;
    if (othersRemain)
        return;
    for (const HeldTexture& held : m_textures)
    {
        if (held.property->get() == held.texture)
            held.property->set(nullptr);
    }
}

bool RendererProperties::isComplete() const
{
    return lightCount && lightDiffuse && lightAmbient && lightSpecular && lightPosition &&
           lightAttenuationNear && lightAttenuationReciprocal && lightSpotInnerCos && lightSpotOuterCos &&
           lightSpotDirection && joints.isComplete() && model && view && modelView && viewProjection &&
           modelViewProjection && normalModel && cameraPosition && time;
}

void RendererProperties::publish(const Solid& solid, const Matrix4f& solidView,
                                 const Matrix4f& solidViewProjection) const
{
    model->set(solid.getWorldTransform());
    modelView->set(solidView);
    modelViewProjection->set(solidViewProjection);
    normalModel->set(solid.getNormalTransform());
}

void RendererProperties::provideTexture(RenderContext& context, AssetCachePool* pool, const char* name,
                                        const char* asset)
{
    const SharedPtr<ShaderUniformBase> present = context.getProperty(name);
    if (present && !present->holds<SharedPtr<Texture2D>>())
        return; // the application's own, a cube perhaps

    const SharedPtr<TextureProperty> property = shareProperty(context, name, 1, SharedPtr<Texture2D>());
    if (!property)
        return;
    if (!property->get() && pool)
        property->set(asset ? pool->getTexture2DCache()->get(asset) : createFlatTexture(*pool));
    if (property->get())
        m_textures.push_back({property, property->get()});
}

} // namespace orv::detail
