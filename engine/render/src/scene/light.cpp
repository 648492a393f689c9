#include "orv/light.h"

#include "orv/scenenodevisitor.h"

#include <cmath>

namespace orv
{

void Light::accept(SceneNodeVisitor& visitor)
{
    visitor.visit(this);
}

void Light::setAttenuationNear(float distance)
{
    m_attenuationNear = std::fabs(distance);
}

void Light::setAttenuationFar(float distance)
{
    m_attenuationFar = std::fabs(distance);
}

void Light::setSpotInnerAngle(const Anglef& angle)
{
    m_spotInnerAngle = abs(angle);
}

void Light::setSpotOuterAngle(const Anglef& angle)
{
    m_spotOuterAngle = abs(angle);
}

void Light::setLightName(const char* name)
{
    m_lightName = name ? name : "";
}

} // namespace orv
