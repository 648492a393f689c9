#include "views.h"

#include "convert/scene/lights.h"

#include <assimp/camera.h>
#include <assimp/light.h>

#include <algorithm>
#include <array>
#include <cmath>

namespace convert::gltf
{

namespace
{

/// Inverse-square attenuation, zero at the end of the range.
void setAttenuation(aiLight& light, double range)
{
    light.mAttenuationConstant = light.mAttenuationLinear = light.mAttenuationQuadratic = 0.0f;
    if (light.mType == aiLightSource_DIRECTIONAL)
        return;
    const aiColor3D& colour = light.mColorDiffuse;
    const double strength = double(std::max({colour.r, colour.g, colour.b}));
    const double limited =
        range > 0.0 ? strength * double(SQUARE_END) * double(SQUARE_END) / (range * range) : 1.0;
    light.mAttenuationQuadratic = float(std::max(1.0, limited));
}

} // namespace

std::unique_ptr<aiCamera> readCamera(const Object& camera, const std::string& nodeName)
{
    auto made = std::make_unique<aiCamera>();
    made->mName = aiString(nodeName);
    made->mLookAt = aiVector3D(0, 0, -1);
    if (camera.text("type") == "orthographic")
    {
        const Object shape = camera.object("orthographic");
        made->mOrthographicWidth = float(shape.number("xmag", 1.0)); // half of it
        made->mClipPlaneNear = float(shape.number("znear", 0.0));
        made->mClipPlaneFar = float(shape.number("zfar", 0.0));
        return made;
    }
    const Object shape = camera.object("perspective");
    const double aspect = shape.number("aspectRatio", 1.0);
    made->mAspect = float(aspect > 0.0 ? aspect : 1.0);
    made->mHorizontalFOV =
        float(2.0 * std::atan(std::tan(shape.number("yfov", 0.0) * 0.5) * double(made->mAspect)));
    made->mClipPlaneNear = float(shape.number("znear", 0.0));
    made->mClipPlaneFar = float(shape.number("zfar", 0.0));
    return made;
}

std::unique_ptr<aiLight> readLight(const Object& light, const std::string& nodeName)
{
    constexpr double QUARTER = 0.7853981633974483;
    auto made = std::make_unique<aiLight>();
    made->mName = aiString(nodeName);
    const std::string type = light.text("type");
    made->mType = type == "directional" ? aiLightSource_DIRECTIONAL
                  : type == "spot"      ? aiLightSource_SPOT
                                        : aiLightSource_POINT;
    made->mDirection = aiVector3D(0, 0, -1);
    made->mUp = aiVector3D(0, 1, 0);
    std::array<float, 3> colour = {1.0f, 1.0f, 1.0f};
    light.numbers("color", colour);
    made->mColorDiffuse = made->mColorSpecular =
        aiColor3D(colour[0], colour[1], colour[2]) * float(light.number("intensity", 1.0));
    setAttenuation(*made, light.number("range", 0.0));
    const Object spot = light.object("spot"); // half angles; libassimp has whole ones
    made->mAngleInnerCone = float(2.0 * spot.number("innerConeAngle", 0.0));
    made->mAngleOuterCone = float(2.0 * spot.number("outerConeAngle", QUARTER));
    return made;
}

} // namespace convert::gltf
