#include "orv/maths.h"

#include <gtest/gtest.h>

#include <cmath>

// Fault caught: a wrong constant or a missing refinement, which no picture shows clearly.
TEST(Maths, fastRootsStayWithinTheirTolerance)
{
    for (float x = 1e-30f; x < 1e30f; x *= 1.37f)
    {
        const float exact = std::sqrt(x);
        EXPECT_NEAR(1.0f, orv::invSqrt(x) * exact, 0.002f) << x;
        EXPECT_NEAR(1.0f, orv::sqrt(x) / exact, 0.002f) << x;
    }
    EXPECT_EQ(0.0f, orv::sqrt(0.0f));
    EXPECT_NE(0.5f, orv::invSqrt(4.0f)) << "the approximation is part of the contract";
}

// Fault caught: a remainder in single precision, which for large x is off by a whole y.
TEST(Maths, remainderIsTakenInDoublePrecision)
{
    EXPECT_EQ(1.5f, orv::fmod(5.5f, 2.0f));
    EXPECT_EQ(-1.5f, orv::fmod(-5.5f, 2.0f));
    EXPECT_EQ(float(std::fmod(1e9, double(0.1f))), orv::fmod(1e9f, 0.1f));
}
