#include "orv/vector.h"

#include "orv/log.h"

#include "textform.h"

namespace orv
{

int detail::indexOutOfRange(int index, int last)
{
    // Logged under the name of the operator.
    pssLogError("engine/maths/src/vector", "operator[]", __LINE__, "Index (%d) out of range [0, %d]", index,
                last);
    return 0;
}

std::string toString(const Vector2f& v)
{
    return detail::textForm("Vector2f", {v.x, v.y});
}

std::string toString(const Vector3f& v)
{
    return detail::textForm("Vector3f", {v.x, v.y, v.z});
}

std::string toString(const Vector4f& v)
{
    return detail::textForm("Vector4f", {v.x, v.y, v.z, v.w});
}

std::string toString(const Vector2i& v)
{
    return detail::textForm("Vector2i", {v.x, v.y});
}

std::string toString(const Vector3i& v)
{
    return detail::textForm("Vector3i", {v.x, v.y, v.z});
}

std::string toString(const Vector4i& v)
{
    return detail::textForm("Vector4i", {v.x, v.y, v.z, v.w});
}

std::string toString(const Vector2b& v)
{
    return detail::textForm("Vector2b", {v.x, v.y});
}

std::string toString(const Vector3b& v)
{
    return detail::textForm("Vector3b", {v.x, v.y, v.z});
}

std::string toString(const Vector4b& v)
{
    return detail::textForm("Vector4b", {v.x, v.y, v.z, v.w});
}

} // namespace orv
