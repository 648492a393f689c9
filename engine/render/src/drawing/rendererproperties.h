#pragma once

#include "orv/log.h"
#include "orv/rendercontext.h"
#include "orv/shaderuniform.h"
#include "orv/sharedptr.h"

#include <vector>

namespace orv
{

class AssetCachePool;
class Solid;

namespace detail
{

inline constexpr int MAX_LIGHTS = 5;

/// The context's property of this name, made with every element at the initial value when there is none. If one of
/// another type or with fewer elements exists (logged), a property outside of any context is returned.
/// @return empty when there is no memory (logged).
template <class T>
SharedPtr<ShaderUniform<T>> shareProperty(RenderContext& context, const char* name, int size,
                                          const T& initial)
{
    const SharedPtr<ShaderUniformBase> held = context.getProperty(name);
    if (held && held->holds<T>() && held->getSize() >= size)
        return SharedPtr<ShaderUniform<T>>(static_cast<ShaderUniform<T>*>(held.get()));

    const SharedPtr<ShaderUniform<T>> property = makeShared<ShaderUniform<T>>(size);
    if (!property || property->getSize() < size)
        return {};
    for (int i = 0; i < size; ++i)
        property->set(initial, i);
    if (held)
        ORV_LOG_ERROR("Property \"%s\" of the context has another type or fewer than %d elements.", name,
                      size);
    else
        context.addProperty(property, name);
    return property;
}

/// The properties for skinning shaders.
struct JointProperties
{
    explicit JointProperties(RenderContext& context);

    bool isComplete() const { return count && world && weightFilled; }

    /// Sets all from the solid's joints and mesh. Elements of world beyond the count are unchanged.
    void publish(const Solid& solid) const;

    SharedPtr<ShaderUniform<int>> count;
    SharedPtr<ShaderUniform<Matrix4f>> world; ///< of Solid::MAX_JOINTS elements, mesh space to world space
    SharedPtr<ShaderUniform<float>> weightFilled;
};

/// The global properties that SimpleRenderer writes or provides; documented there.
struct RendererProperties
{
    /// @param pool  may be null: texture properties stay null then.
    RendererProperties(RenderContext& context, AssetCachePool* pool);

    /// If no other renderer shares these properties, removes the textures set at construction, so that a context does
    /// not keep its pool's textures alive.
    ~RendererProperties();

    /// Whether all properties written each frame could be allocated.
    bool isComplete() const;

    /// Sets the transforms to those of one solid.
    void publish(const Solid& solid, const Matrix4f& solidView, const Matrix4f& solidViewProjection) const;

    RendererProperties(const RendererProperties&) = delete;
    RendererProperties& operator=(const RendererProperties&) = delete;

    SharedPtr<ShaderUniform<int>> lightCount;
    SharedPtr<ShaderUniform<Vector4f>> lightDiffuse;
    SharedPtr<ShaderUniform<Vector4f>> lightAmbient;
    SharedPtr<ShaderUniform<Vector4f>> lightSpecular;
    SharedPtr<ShaderUniform<Vector4f>> lightPosition;
    SharedPtr<ShaderUniform<float>> lightAttenuationNear;
    SharedPtr<ShaderUniform<float>> lightAttenuationReciprocal;
    SharedPtr<ShaderUniform<float>> lightSpotInnerCos;
    SharedPtr<ShaderUniform<float>> lightSpotOuterCos;
    SharedPtr<ShaderUniform<Vector3f>> lightSpotDirection;
    JointProperties joints;
    SharedPtr<ShaderUniform<Matrix4f>> model;
    SharedPtr<ShaderUniform<Matrix4f>> view;
    SharedPtr<ShaderUniform<Matrix4f>> modelView;
    SharedPtr<ShaderUniform<Matrix4f>> viewProjection;
    SharedPtr<ShaderUniform<Matrix4f>> modelViewProjection;
    SharedPtr<ShaderUniform<Matrix3f>> normalModel;
    SharedPtr<ShaderUniform<Vector4f>> cameraPosition;
    SharedPtr<ShaderUniform<float>> time;

private:
    void markTransforms();

    using TextureProperty = ShaderUniform<SharedPtr<Texture2D>>;

    struct HeldTexture
    {
        SharedPtr<TextureProperty> property;
        SharedPtr<Texture2D> texture;
    };

    /// @param asset  null for one texel of a surface without bumps.
    void provideTexture(RenderContext& context, AssetCachePool* pool, const char* name, const char* asset);

    std::vector<HeldTexture> m_textures;
    SharedPtr<ShaderUniform<int>> m_sharers; // read by no shader: counts the renderers
};

} // namespace detail
} // namespace orv
