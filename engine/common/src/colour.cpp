#include "orv/colour.h"

namespace orv
{

const Colour4f Colour4f::RED(1.0f, 0.0f, 0.0f, 1.0f);
const Colour4f Colour4f::GREEN(0.0f, 1.0f, 0.0f, 1.0f);
const Colour4f Colour4f::BLUE(0.0f, 0.0f, 1.0f, 1.0f);
const Colour4f Colour4f::BLACK(0.0f, 0.0f, 0.0f, 1.0f);
const Colour4f Colour4f::WHITE(1.0f, 1.0f, 1.0f, 1.0f);
const Colour4f Colour4f::LIGHT_GREY(0.67f, 0.67f, 0.67f, 1.0f);
const Colour4f Colour4f::DARK_GREY(0.33f, 0.33f, 0.33f, 1.0f);

void Colour4f::setColour(unsigned char red, unsigned char green, unsigned char blue, unsigned char alpha)
{
    r = float(red) / 255.0f;
    g = float(green) / 255.0f;
    b = float(blue) / 255.0f;
    a = float(alpha) / 255.0f;
}

void Colour4f::scale(float factor)
{
    r *= factor;
    g *= factor;
    b *= factor;
    a *= factor;
}

Colour4f operator+(const Colour4f& a, const Colour4f& b)
{
    return Colour4f(a.r + b.r, a.g + b.g, a.b + b.b, a.a + b.a);
}

Colour4f operator-(const Colour4f& a, const Colour4f& b)
{
    return Colour4f(a.r - b.r, a.g - b.g, a.b - b.b, a.a - b.a);
}

Colour4f operator*(const Colour4f& a, const Colour4f& b)
{
    return Colour4f(a.r * b.r, a.g * b.g, a.b * b.b, a.a * b.a);
}

Colour4f operator/(const Colour4f& a, const Colour4f& b)
{
    return Colour4f(a.r / b.r, a.g / b.g, a.b / b.b, a.a / b.a);
}

} // namespace orv
