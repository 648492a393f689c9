#include "orv/sceneanimators.h"

#include "orv/light.h"
#include "orv/scenenode.h"

#include <limits>

// Each target is fetched by operator->, which logs when there is none.

namespace orv
{

SceneNodePositionAnimator::SceneNodePositionAnimator(const SharedPtr<SceneNode>& node) : m_node(node) {}

SceneNodePositionAnimator::~SceneNodePositionAnimator() = default;

void SceneNodePositionAnimator::apply(const Vector3f& position)
{
    if (SceneNode* node = m_node.getLogged())
        node->setPosition(position);
}

SceneNodeRotationAnimator::SceneNodeRotationAnimator(const SharedPtr<SceneNode>& node) : m_node(node) {}

SceneNodeRotationAnimator::~SceneNodeRotationAnimator() = default;

void SceneNodeRotationAnimator::apply(const Vector4f& axisAngle)
{
    if (SceneNode* node = m_node.getLogged())
        node->setRotation(quaternionFromAxisAngle(axisAngle.xyz(), Anglef::fromRadians(axisAngle.w)));
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

LightColourAnimator::LightColourAnimator(const SharedPtr<Light>& light) : m_light(light) {}

LightColourAnimator::~LightColourAnimator() = default;

void LightColourAnimator::apply(const Colour4f& colour)
{
    if (Light* light = m_light.getLogged())
        light->setColour(colour);
}

LightIntensityAnimator::LightIntensityAnimator(const SharedPtr<Light>& light) : m_light(light) {}

LightIntensityAnimator::~LightIntensityAnimator() = default;

void LightIntensityAnimator::apply(const float& intensity)
{
    if (Light* light = m_light.getLogged())
        light->setIntensity(intensity);
}

} // namespace orv
