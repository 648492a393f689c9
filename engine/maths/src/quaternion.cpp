#include "orv/quaternion.h"

#include "textform.h"

#include <algorithm>

namespace orv
{

namespace
{

/// Below this angle, in radians, the arc and its chord are the same to a float.
constexpr float STRAIGHT_ANGLE = 1e-3f;

float getLength(const Quaternionf& q)
{
    return std::sqrt(q.a * q.a + q.x * q.x + q.y * q.y + q.z * q.z);
}

Quaternionf combine(const Quaternionf& p, float pFactor, const Quaternionf& q, float qFactor)
{
    return Quaternionf(p.a * pFactor + q.a * qFactor, p.x * pFactor + q.x * qFactor,
                       p.y * pFactor + q.y * qFactor, p.z * pFactor + q.z * qFactor);
}

} // namespace

Quaternionf slerp(const Quaternionf& from, const Quaternionf& to, float share)
{
    const float fromLength = getLength(from);
    const float toLength = getLength(to);
    const float product = fromLength * toLength;
    if (!(product > 0.0f) || !std::isfinite(product) || from == to)
        return from;
    const float dot = from.a * to.a + from.x * to.x + from.y * to.y + from.z * to.z;
    const float sign = dot < 0.0f ? -1.0f : 1.0f;
    // Twice the arc tangent of half the chord over half the other one: exact for small angles, as no arc cosine is.
    const Quaternionf across = combine(from, 1.0f / fromLength, to, -sign / toLength);
    const Quaternionf along = combine(from, 1.0f / fromLength, to, sign / toLength);
    const float angle = 2.0f * std::atan2(getLength(across), getLength(along));
    if (angle < STRAIGHT_ANGLE)
        return combine(from, 1.0f - share, to, sign * share);
    const float sine = std::sin(angle);
    return combine(from, std::sin((1.0f - share) * angle) / sine, to, sign * std::sin(share * angle) / sine);
}

std::string toString(const Quaternionf& q)
{
    // Rounding can leave a scalar just outside -1 to 1, where neither root nor arc cosine exists.
    const float a = std::clamp(q.a, -1.0f, 1.0f);
    const bool turns = std::fabs(a) != 1.0f;
    const Vector3f axis = turns ? Vector3f(q.x, q.y, q.z) / std::sqrt(1.0f - a * a) : Vector3f::Y_AXIS;
    const Anglef angle = Anglef::fromRadians(2.0f * std::acos(a));
    return detail::textForm("Quaternionf", {q.a, q.x, q.y, q.z}) + " (\n  " + toString(axis) + "\n  " +
           toString(angle) + "\n)";
}

} // namespace orv
