#pragma once

#include "orv/vector.h"

#include <assimp/material.h>

namespace convert
{

// A material's values by libassimp's keys, each of which is a name, a kind of picture and a number. The fallback
// replaces values that are missing or not finite.

/// A colour of three components has alpha 1.
orv::Vector4f getColour(const aiMaterial& material, const char* key, unsigned type, unsigned index,
                        const orv::Vector4f& fallback);
/// From linear light, as in glTF, to sRGB, as in the engine's materials; alpha stays.
orv::Vector4f toScreen(const orv::Vector4f& light);

float getFloat(const aiMaterial& material, const char* key, unsigned type, unsigned index, float fallback);
int getInt(const aiMaterial& material, const char* key, unsigned type, unsigned index, int fallback = 0);
bool hasFloat(const aiMaterial& material, const char* key, unsigned type, unsigned index);

} // namespace convert
