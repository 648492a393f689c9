#include "orv/maths.h"

#include <cmath>
#include <cstdint>
#include <cstring>

namespace orv
{

float invSqrt(float x)
{
    static_assert(sizeof(int32_t) == sizeof(float));
    int32_t bits;
    std::memcpy(&bits, &x, sizeof bits);
    bits = int32_t(0x5F375A86u - uint32_t(bits / 2)); // wraps for negative numbers, whose root means nothing
    float y;
    std::memcpy(&y, &bits, sizeof y);
    return y * (1.5f - 0.5f * x * y * y);
}

float sqrt(float x)
{
    return x == 0.0f ? 0.0f : 1.0f / invSqrt(x);
}

float fmod(float x, float y)
{
    return float(std::fmod(double(x), double(y)));
}

} // namespace orv
