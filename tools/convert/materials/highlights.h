#pragma once

#include "orv/vector.h"

namespace convert
{

/// The engine's highlight: colour x level x (cosine to the power of shininess).
struct Highlight
{
    orv::Vector4f colour = orv::Vector4f(0.0f, 0.0f, 0.0f, 1.0f);
    float level = 0.0f;
    float shininess = 1.0f;
};

/// @param base  colour of the surface.
/// @param metalness, roughness  0 to 1.
/// @param mirrored  specular reflectance as a non-metal, relative to the usual one.
Highlight fromMetalness(const orv::Vector4f& base, float metalness, float roughness,
                        const orv::Vector4f& mirrored = {1.0f, 1.0f, 1.0f, 1.0f});

/// @param specular    reflectance at normal incidence, by colour.
/// @param glossiness  0 to 1.
Highlight fromGlossiness(const orv::Vector4f& specular, float glossiness);

/// @param shininess  exponent of Phong or Blinn; limited to 128.
Highlight fromShininess(const orv::Vector4f& specular, float level, float shininess);

} // namespace convert
