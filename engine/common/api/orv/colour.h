#pragma once

#include "orv/export.h"

namespace orv
{

/// A colour with opacity: four floats, normally 0 to 1, as the GL takes them (no colour space conversion).
struct ORV_API Colour4f
{
    float r = 0.0f; ///< Red, green, blue and opacity, from 0 to 1.
    float g = 0.0f;
    float b = 0.0f;
    float a = 0.0f;

    constexpr Colour4f() = default;
    /// Components from 0 to 1.
    constexpr Colour4f(float red, float green, float blue, float alpha) : r(red), g(green), b(blue), a(alpha)
    {
    }

    /// Each component becomes its byte divided by 255.
    void setColour(unsigned char red, unsigned char green, unsigned char blue, unsigned char alpha);

    /// Multiplies all four components, opacity included.
    void scale(float factor);

    static const Colour4f RED; ///< Opaque colours.
    static const Colour4f GREEN;
    static const Colour4f BLUE;
    static const Colour4f BLACK;
    static const Colour4f WHITE;
    static const Colour4f LIGHT_GREY;
    static const Colour4f DARK_GREY;
};

/// Component by component, opacity included. Division is plain: a zero component yields infinity or NaN.
ORV_API Colour4f operator+(const Colour4f& a, const Colour4f& b);
ORV_API Colour4f operator-(const Colour4f& a, const Colour4f& b);
ORV_API Colour4f operator*(const Colour4f& a, const Colour4f& b);
ORV_API Colour4f operator/(const Colour4f& a, const Colour4f& b);

inline bool operator==(const Colour4f& a, const Colour4f& b)
{
    return a.r == b.r && a.g == b.g && a.b == b.b && a.a == b.a;
}

} // namespace orv
