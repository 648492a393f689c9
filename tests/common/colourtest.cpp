#include "orv/colour.h"

#include <gtest/gtest.h>

using namespace orv;

// Fault caught: opacity left out of the arithmetic, or bytes divided by 256.
TEST(Colour4f, arithmeticTakesInAllFourComponents)
{
    Colour4f colour;
    colour.setColour(255, 0, 128, 255);
    EXPECT_EQ(Colour4f(1.0f, 0.0f, 128.0f / 255.0f, 1.0f), colour);

    const Colour4f a(0.5f, 1.0f, 1.5f, 2.0f);
    const Colour4f b(0.25f, 0.5f, 2.0f, 4.0f);
    EXPECT_EQ(Colour4f(0.75f, 1.5f, 3.5f, 6.0f), a + b);
    EXPECT_EQ(Colour4f(0.25f, 0.5f, -0.5f, -2.0f), a - b);
    EXPECT_EQ(Colour4f(0.125f, 0.5f, 3.0f, 8.0f), a * b);
    EXPECT_EQ(Colour4f(2.0f, 2.0f, 0.75f, 0.5f), a / b);

    colour = a;
    colour.scale(2.0f);
    EXPECT_EQ(Colour4f(1.0f, 2.0f, 3.0f, 4.0f), colour);
}
