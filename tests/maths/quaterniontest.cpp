#include "orv/quaternion.h"

#include "support/logcapture.h"

#include <gtest/gtest.h>

using namespace orv;

TEST(Quaternion, textForms)
{
    EXPECT_EQ("Anglef(90 degrees)", toString(Anglef::fromDegrees(90)));
    const struct
    {
        Quaternionf q;
        const char* expected;
    } cases[] = {
        {Quaternionf::IDENTITY, "Quaternionf(1, 0, 0, 0) (\n  Vector3f(0, 1, 0)\n  Anglef(0 degrees)\n)"},
        {Quaternionf(0, 0, 0, 1), "Quaternionf(0, 0, 0, 1) (\n  Vector3f(0, 0, 1)\n  Anglef(180 degrees)\n)"},
        {Quaternionf(-1, 0, 0, 0),
         "Quaternionf(-1, 0, 0, 0) (\n  Vector3f(0, 1, 0)\n  Anglef(360 degrees)\n)"},
        {Quaternionf(std::nextafter(1.0f, 2.0f), 0, 0, 0), // by rounding
         "Quaternionf(1, 0, 0, 0) (\n  Vector3f(0, 1, 0)\n  Anglef(0 degrees)\n)"},
    };
    for (const auto& c : cases)
        EXPECT_EQ(c.expected, toString(c.q));
}
