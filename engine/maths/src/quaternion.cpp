#include "orv/quaternion.h"

#include "textform.h"

#include <algorithm>

namespace orv
{

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
