#include "highlights.h"

#include <algorithm>
#include <cmath>

// docs/convert.md says the same in a table.

namespace convert
{

using orv::Vector4f;

namespace
{

constexpr float SMOOTHEST = 0.15f; // least roughness: below it, highlights would be points
constexpr float SHARPEST = 128.0f; // largest exponent that mediump computes well
constexpr float NOT_METAL = 0.04f; // specular reflectance of non-metals

float toShininess(float roughness)
{
    const float slope = std::pow(std::clamp(roughness, SMOOTHEST, 1.0f), 4.0f);
    return std::clamp(2.0f / slope - 2.0f, 1.0f, SHARPEST);
}

float toLevel(float metalness, float roughness)
{
    const float smoothness = 1.0f - std::clamp(roughness, SMOOTHEST, 1.0f);
    return (0.5f + 0.5f * metalness) * smoothness * smoothness;
}

} // namespace

Highlight fromMetalness(const Vector4f& base, float metalness, float roughness, const Vector4f& mirrored)
{
    const float metal = std::clamp(metalness, 0.0f, 1.0f);
    const auto tint = [metal](float other, float colour) { return std::lerp(other, colour, metal); };
    return {Vector4f(tint(mirrored.x, base.x), tint(mirrored.y, base.y), tint(mirrored.z, base.z), 1.0f),
            toLevel(metal, roughness), toShininess(roughness)};
}

Highlight fromGlossiness(const Vector4f& specular, float glossiness)
{
    const float most = std::max({specular.x, specular.y, specular.z});
    if (!(most > 0.0f))
        return {};
    const float metal = std::clamp((most - NOT_METAL) / (1.0f - NOT_METAL), 0.0f, 1.0f);
    const float level = toLevel(metal, 1.0f - glossiness) * std::min(1.0f, most / NOT_METAL);
    return {Vector4f(specular.x / most, specular.y / most, specular.z / most, 1.0f), level,
            toShininess(1.0f - glossiness)};
}

Highlight fromShininess(const Vector4f& specular, float level, float shininess)
{
    if (!(shininess > 0.0f) || !(level > 0.0f)) // an exponent of 0 would cover the whole surface
        return {};
    // Below 1 it is not an exponent but a fraction, as written by 3ds Max and others.
    return {specular, level, std::min(shininess < 1.0f ? shininess * SHARPEST : shininess, SHARPEST)};
}

} // namespace convert
