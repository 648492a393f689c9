#include "materialvalues.h"

#include <cmath>

namespace convert
{

orv::Vector4f getColour(const aiMaterial& material, const char* key, unsigned type, unsigned index,
                        const orv::Vector4f& fallback)
{
    aiColor4D colour;
    if (material.Get(key, type, index, colour) != aiReturn_SUCCESS)
        return fallback;
    const bool isFinite = std::isfinite(colour.r) && std::isfinite(colour.g) && std::isfinite(colour.b) &&
                          std::isfinite(colour.a);
    return isFinite ? orv::Vector4f(colour.r, colour.g, colour.b, colour.a) : fallback;
}

orv::Vector4f toScreen(const orv::Vector4f& light)
{
    const auto encode = [](double share)
    { return float(share <= 0.0031308 ? share * 12.92 : 1.055 * std::pow(share, 1.0 / 2.4) - 0.055); };
    return {encode(light.x), encode(light.y), encode(light.z), light.w};
}

float getFloat(const aiMaterial& material, const char* key, unsigned type, unsigned index, float fallback)
{
    float value = 0.0f;
    return material.Get(key, type, index, value) == aiReturn_SUCCESS && std::isfinite(value) ? value
                                                                                             : fallback;
}

int getInt(const aiMaterial& material, const char* key, unsigned type, unsigned index, int fallback)
{
    int value = 0;
    return material.Get(key, type, index, value) == aiReturn_SUCCESS ? value : fallback;
}

bool hasFloat(const aiMaterial& material, const char* key, unsigned type, unsigned index)
{
    float value = 0.0f;
    return material.Get(key, type, index, value) == aiReturn_SUCCESS;
}

} // namespace convert
