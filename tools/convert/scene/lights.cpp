#include "lights.h"

#include "placement.h"

#include <assimp/camera.h>
#include <assimp/light.h>

#include <algorithm>
#include <cmath>

namespace convert
{

namespace
{

constexpr float PHYSICAL = 4.0f; ///< a brighter light is in physical units, which the engine lacks

/// The distance at which a light has faded, by the model's attenuation: k + l d + q d^2 = strength / SPENT.
float findEnd(const aiLight& light, float strength)
{
    constexpr double NEAREST = 1e-3;
    constexpr double FARTHEST = 1e6;
    const double k = double(light.mAttenuationConstant) - double(strength) / double(SPENT);
    const double l = std::max(0.0, double(light.mAttenuationLinear));
    const double q = std::max(0.0, double(light.mAttenuationQuadratic));
    if (k >= 0.0)
        return float(NEAREST);
    const double end = -2.0 * k / (l + std::sqrt(l * l - 4.0 * q * k)); // also valid for q = 0
    return float(std::clamp(end, NEAREST, FARTHEST));
}

/// 1 at the distance where the light's own strength is 1; at smaller distances both saturate.
void setSquare(float strength, float factor, glo::LightDefinition& made)
{
    made.intensity = SQUARE_END / (SQUARE_END - 1.0f);
    made.attenuated = 1;
    made.attenuationNear = 0.0f;
    made.attenuationFar = std::clamp(SQUARE_END * std::sqrt(strength / factor), 1e-3f, 1e6f);
}

void setAttenuation(const aiLight& light, float strength, glo::LightDefinition& made)
{
    made.attenuated = light.mAttenuationLinear > 0.0f || light.mAttenuationQuadratic > 0.0f;
    if (made.attenuated == 0)
        return;
    made.attenuationNear = 0.0f;
    made.attenuationFar = findEnd(light, strength);
}

} // namespace

bool convertLight(const aiLight& light, glo::LightDefinition& made, Report& report)
{
    switch (light.mType)
    {
    case aiLightSource_DIRECTIONAL: made.type = glo::light::DIRECTIONAL; break;
    case aiLightSource_POINT: made.type = glo::light::POINT; break;
    case aiLightSource_SPOT: made.type = glo::light::SPOT; break;
    case aiLightSource_AREA:
        made.type = glo::light::POINT;
        report.approximate("area-light", "the extent of an area light (a point light instead)");
        break;
    default:
        report.lose("ambient-light", "an ambient light (the engine's lights have positions)");
        return false;
    }
    const aiColor3D& colour = light.mColorDiffuse;
    const float strength = std::max({float(colour.r), float(colour.g), float(colour.b)});
    if (!(strength > 0.0f) || !std::isfinite(strength))
    {
        report.lose("dark-light", "a light without any brightness");
        return false;
    }
    made.colour = orv::Vector3f(colour.r / strength, colour.g / strength, colour.b / strength);
    made.intensity = strength;
    const bool isSquare = light.mAttenuationConstant == 0.0f && light.mAttenuationLinear == 0.0f &&
                          light.mAttenuationQuadratic > 0.0f;
    if (light.mAttenuationConstant > 0.0f && light.mType != aiLightSource_DIRECTIONAL)
        made.intensity = strength / float(light.mAttenuationConstant);
    if (made.intensity > PHYSICAL && (light.mType == aiLightSource_DIRECTIONAL || !isSquare))
    {
        report.approximate("light-brightness", "the brightness of a light in physical units (1 instead)");
        made.intensity = 1.0f;
    }
    made.attenuated = 0;
    if (light.mType != aiLightSource_DIRECTIONAL && isSquare)
        setSquare(strength, float(light.mAttenuationQuadratic), made);
    else if (light.mType != aiLightSource_DIRECTIONAL)
        setAttenuation(light, strength, made);
    if (light.mType == aiLightSource_SPOT)
    {
        made.spotInner = float(light.mAngleInnerCone);
        made.spotOuter = std::max(made.spotInner, float(light.mAngleOuterCone));
    }
    return true;
}

glo::CameraDefinition convertCamera(const aiCamera& camera)
{
    glo::CameraDefinition made;
    made.farDistance = camera.mClipPlaneFar > 0.0f ? float(camera.mClipPlaneFar) : 1000.0f;
    made.nearDistance = float(camera.mClipPlaneNear);
    if (!(made.nearDistance > 0.0f && made.nearDistance < made.farDistance))
        made.nearDistance = made.farDistance / 1000.0f;
    if (camera.mOrthographicWidth > 0.0f)
    {
        made.projection = glo::projection::ORTHOGRAPHIC;
        made.width = 2.0f * float(camera.mOrthographicWidth);
        return made;
    }
    // The model's angle is horizontal, the engine's spans the shorter side.
    const float angle = float(camera.mHorizontalFOV);
    if (!(angle > 0.0f && angle < 3.1f))
        return made;
    const float aspect = camera.mAspect > 0.0f ? float(camera.mAspect) : 1.0f;
    made.fieldOfView = 2.0f * std::atan(std::tan(angle * 0.5f) * std::min(1.0f / aspect, 1.0f));
    return made;
}

aiMatrix4x4 placeCamera(const aiCamera& camera, const aiMatrix4x4& node)
{
    // Some importers repeat the node's position; some keep a new aiCamera's defaults, although cameras of their formats
    // (ASE, LWS, OpenGEX) look along -z.
    const bool isRepeated = camera.mPosition == aiVector3D(node.a4, node.b4, node.c4);
    const bool isUntouched = camera.mLookAt == aiVector3D(0, 0, 1) && camera.mUp == aiVector3D(0, 1, 0);
    return lookingAlong(isRepeated ? aiVector3D() : camera.mPosition,
                        isUntouched ? aiVector3D(0, 0, -1) : camera.mLookAt, camera.mUp);
}

} // namespace convert
