#pragma once

#include "orv/export.h"

#include <string>

namespace orv
{

/// An angle, kept in radians; the unit is named wherever a number goes in or comes out. Starts as 0.
template <class T>
class ORV_API Angle
{
public:
    constexpr Angle() = default;

    /// An angle from a number of radians, or of degrees.
    static constexpr Angle fromRadians(T radians) { return Angle(radians); }
    static constexpr Angle fromDegrees(T degrees) { return Angle(degrees / DEGREES_PER_RADIAN); }

    constexpr T radians() const { return m_radians; } ///< Its size.
    constexpr T degrees() const { return m_radians * DEGREES_PER_RADIAN; }

    constexpr Angle operator-() const { return Angle(-m_radians); }

    friend constexpr Angle operator+(Angle a, Angle b) { return Angle(a.m_radians + b.m_radians); }
    friend constexpr Angle operator-(Angle a, Angle b) { return Angle(a.m_radians - b.m_radians); }
    friend constexpr Angle operator*(Angle angle, T factor) { return Angle(angle.m_radians * factor); }
    friend constexpr Angle operator*(T factor, Angle angle) { return angle * factor; }
    friend constexpr Angle operator/(Angle angle, T divisor) { return Angle(angle.m_radians / divisor); }
    friend constexpr bool operator==(Angle a, Angle b) { return a.m_radians == b.m_radians; }
    friend constexpr bool operator<(Angle a, Angle b) { return a.m_radians < b.m_radians; }
    /// Without its sign.
    friend constexpr Angle abs(Angle angle) { return angle.m_radians < T(0) ? -angle : angle; }

private:
    static constexpr T DEGREES_PER_RADIAN = T(180) / T(3.1415927);

    constexpr explicit Angle(T radians) : m_radians(radians) {}

    T m_radians = T();
};

using Anglef = Angle<float>; ///< The angle that the engine takes.

/// In degrees: "Anglef(90 degrees)".
ORV_API std::string toString(const Anglef& angle);

} // namespace orv
