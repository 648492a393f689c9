#include "orv/bounds.h"

#include <cmath>

namespace orv
{

void Box::add(const Box& box)
{
    if (box.isEmpty())
        return;
    add(box.lowest);
    add(box.highest);
}

Box transform(const Box& box, const Matrix4f& m)
{
    Box result;
    if (box.isEmpty())
        return result;
    const Vector3f centre = (m * Vector4f(box.getCentre(), 1.0f)).xyz();
    const Vector3f half = (box.highest - box.lowest) * 0.5f;
    Vector3f reach;
    for (int row = 0; row < 3; ++row)
        reach[row] =
            std::fabs(m[0][row]) * half.x + std::fabs(m[1][row]) * half.y + std::fabs(m[2][row]) * half.z;
    result.lowest = centre - reach;
    result.highest = centre + reach;
    return result;
}

Bounds::Bounds(const Box& boxAround)
    : box(boxAround)
    , radius(boxAround.isEmpty() ? -1.0f : length(boxAround.highest - boxAround.lowest) * 0.5f)
{
}

Bounds computeBounds(const Vector3f* places, std::size_t count)
{
    const auto isFinite = [](const Vector3f& place) { return std::isfinite(place.x + place.y + place.z); };
    Box box;
    for (std::size_t i = 0; i < count; ++i)
    {
        if (isFinite(places[i]))
            box.add(places[i]);
    }
    if (box.isEmpty())
        return {};
    float largest = 0.0f;
    for (std::size_t i = 0; i < count; ++i)
    {
        const Vector3f offset = places[i] - box.getCentre();
        if (isFinite(places[i]))
            largest = std::max(largest, dot(offset, offset));
    }
    return Bounds(box, std::sqrt(largest));
}

} // namespace orv
