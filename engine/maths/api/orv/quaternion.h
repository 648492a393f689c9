#pragma once

#include "orv/angle.h"
#include "orv/export.h"
#include "orv/vector.h"

#include <cmath>
#include <string>

namespace orv
{

/// A rotation as four components, the scalar first: a, then the vector part x, y, z. Starts as the identity.
template <class T>
struct ORV_API Quaternion
{
    T a = T(1); ///< The scalar part, and the vector part.
    T x = T();
    T y = T();
    T z = T();

    constexpr Quaternion() = default;
    /// Its parts, the scalar first.
    constexpr Quaternion(T scalar, T xValue, T yValue, T zValue) : a(scalar), x(xValue), y(yValue), z(zValue)
    {
    }

    /// The rotation that turns by q first, then by p.
    friend constexpr Quaternion operator*(const Quaternion& p, const Quaternion& q)
    {
        return Quaternion(
            p.a * q.a - p.x * q.x - p.y * q.y - p.z * q.z, p.a * q.x + p.x * q.a + p.y * q.z - p.z * q.y,
            p.a * q.y - p.x * q.z + p.y * q.a + p.z * q.x, p.a * q.z + p.x * q.y - p.y * q.x + p.z * q.a);
    }
    friend constexpr bool operator==(const Quaternion& p, const Quaternion& q)
    {
        return p.a == q.a && p.x == q.x && p.y == q.y && p.z == q.z;
    }

    static const Quaternion IDENTITY; ///< Turns nothing.
};

template <class T>
constexpr Quaternion<T> Quaternion<T>::IDENTITY(T(1), T(0), T(0), T(0));

using Quaternionf = Quaternion<float>; ///< The quaternion that the engine takes.

/// Turns by angle about axis, counter-clockwise when the axis points at the viewer.
/// @param axis  taken as given, so of unit length for a quaternion of unit length.
inline Quaternionf quaternionFromAxisAngle(const Vector3f& axis, Anglef angle)
{
    const float sine = std::sin(angle.radians() * 0.5f);
    return Quaternionf(std::cos(angle.radians() * 0.5f), axis.x * sine, axis.y * sine, axis.z * sine);
}

/// The rotation that lies share of the way from one to another: the short way round, at constant speed.
///
/// Quaternions of unit length give one of unit length; others keep their lengths in proportion. Of two ways of the same
/// length (half a turn) it takes one. What is not finite is not gone to: then the result is from.
/// @param share  0 is from, 1 is to, each exactly (to perhaps with all signs changed, which is the same rotation).
ORV_API Quaternionf slerp(const Quaternionf& from, const Quaternionf& to, float share);

/// The four components, then axis and angle on lines of their own. The axis of no rotation prints as Y_AXIS.
ORV_API std::string toString(const Quaternionf& q);

} // namespace orv
