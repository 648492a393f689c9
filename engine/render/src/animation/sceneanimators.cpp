#include "orv/sceneanimators.h"

#include "orv/light.h"
#include "orv/scenenode.h"

#include <limits>

// Each target is fetched by operator->, which logs when there is none.

namespace orv
{

namespace
{

Vector4f toVector4(const Vector3f& v)
{
    return Vector4f(v.x, v.y, v.z, 0.0f);
}

Quaternionf toQuaternion(const Vector4f& axisAngle)
{
    return quaternionFromAxisAngle(axisAngle.xyz(), Anglef::fromRadians(axisAngle.w));
}

} // namespace

SceneNodePositionAnimator::SceneNodePositionAnimator(const SharedPtr<SceneNode>& node) : m_node(node) {}

SceneNodePositionAnimator::~SceneNodePositionAnimator() = default;

void SceneNodePositionAnimator::apply(const Vector3f& position)
{
    if (SceneNode* node = m_node.getLogged())
        node->setPosition(position);
}

void SceneNodePositionAnimator::applyMixed(const Vector3f& from, const Vector3f& to, float share,
                                           const AnimationMix& mix)
{
    SceneNode* node = m_node.getLogged();
    if (!node || !mix.reaches(node))
        return;
    const Vector3f value = AnimationMix::between(from, to, share);
    const Vector3f& current = node->getPosition();
    node->setPosition(mix.resolve(&current, toVector4(current), toVector4(value)).xyz());
}

SceneNodeRotationAnimator::SceneNodeRotationAnimator(const SharedPtr<SceneNode>& node) : m_node(node) {}

SceneNodeRotationAnimator::~SceneNodeRotationAnimator() = default;

void SceneNodeRotationAnimator::apply(const Vector4f& axisAngle)
{
    if (SceneNode* node = m_node.getLogged())
        node->setRotation(toQuaternion(axisAngle));
}

void SceneNodeRotationAnimator::applyMixed(const Vector4f& from, const Vector4f& to, float share,
                                           const AnimationMix& mix)
{
    SceneNode* node = m_node.getLogged();
    if (!node || !mix.reaches(node))
        return;
    Quaternionf value = toQuaternion(from);
    if (share > 0.0f && !(from == to))
        value = AnimationMix::between(value, toQuaternion(to), share);
    const Quaternionf& current = node->getRotation();
    node->setRotation(mix.resolve(&current, current, value));
}

SceneNodeScaleAnimator::SceneNodeScaleAnimator(const SharedPtr<SceneNode>& node)
    : m_node(node)
    , m_lastScale(std::numeric_limits<float>::quiet_NaN(), 0.0f, 0.0f)
{
}

SceneNodeScaleAnimator::~SceneNodeScaleAnimator() = default;

void SceneNodeScaleAnimator::apply(const Vector3f& scale)
{
    if (scale == m_lastScale)
        return;
    SceneNode* node = m_node.getLogged();
    if (!node)
        return;
    node->setScale(scale);
    m_lastScale = scale;
}

void SceneNodeScaleAnimator::applyMixed(const Vector3f& from, const Vector3f& to, float share,
                                        const AnimationMix& mix)
{
    SceneNode* node = m_node.getLogged();
    if (!node || !mix.reaches(node))
        return;
    const Vector3f value = AnimationMix::between(from, to, share);
    const Vector3f& current = node->getScale();
    m_lastScale = mix.resolve(&current, toVector4(current), toVector4(value)).xyz();
    node->setScale(m_lastScale);
}

LightColourAnimator::LightColourAnimator(const SharedPtr<Light>& light) : m_light(light) {}

LightColourAnimator::~LightColourAnimator() = default;

void LightColourAnimator::apply(const Colour4f& colour)
{
    if (Light* light = m_light.getLogged())
        light->setColour(colour);
}

void LightColourAnimator::applyMixed(const Colour4f& from, const Colour4f& to, float share,
                                     const AnimationMix& mix)
{
    Light* light = m_light.getLogged();
    if (!light || !mix.reaches(light))
        return;
    const Colour4f value = AnimationMix::between(from, to, share);
    const Colour4f& current = light->getColour();
    const Vector4f mixed = mix.resolve(&current, Vector4f(current.r, current.g, current.b, current.a),
                                       Vector4f(value.r, value.g, value.b, value.a));
    light->setColour(Colour4f(mixed.x, mixed.y, mixed.z, mixed.w));
}

LightIntensityAnimator::LightIntensityAnimator(const SharedPtr<Light>& light) : m_light(light) {}

LightIntensityAnimator::~LightIntensityAnimator() = default;

void LightIntensityAnimator::apply(const float& intensity)
{
    if (Light* light = m_light.getLogged())
        light->setIntensity(intensity);
}

void LightIntensityAnimator::applyMixed(const float& from, const float& to, float share,
                                        const AnimationMix& mix)
{
    Light* light = m_light.getLogged();
    if (light && mix.reaches(light))
        light->setIntensity(
            mix.resolve(light, light->getIntensity(), AnimationMix::between(from, to, share)));
}

} // namespace orv
