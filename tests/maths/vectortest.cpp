#include "orv/vector.h"

#include "support/logcapture.h"

#include <gtest/gtest.h>

#include <limits>

using namespace orv;

// Fault caught: an index taken from a file or a loop read beyond the vector.
TEST(Vector, indexOutOfRangeIsLoggedAndGivesTheFirstComponent)
{
    const Vector2f two(10, 11);
    const Vector3f three(20, 21, 22);
    Vector4i four(30, 31, 32, 33);

    support::LogCapture log;
    EXPECT_EQ(11, two[1]);
    EXPECT_EQ(22, three[2]);
    EXPECT_EQ(33, four[3]);
    EXPECT_EQ("", log.text());

    EXPECT_EQ(10, two[2]);
    EXPECT_EQ(1, log.countMessage("Index (2) out of range [0, 1]"));
    EXPECT_EQ(20, three[3]);
    EXPECT_EQ(1, log.countMessage("Index (3) out of range [0, 2]"));
    four[-1] = 5;
    EXPECT_EQ(Vector4i(5, 31, 32, 33), four);
    EXPECT_EQ(1, log.countMessage("Index (-1) out of range [0, 3]"));
    EXPECT_EQ(3, log.count('E'));
}

// Fault caught: a component forgotten or exchanged in one of the many near-identical lines.
TEST(Vector, operatorsReachEveryComponent)
{
    const Vector2f a2(2, 3), b2(5, 7);
    EXPECT_EQ(Vector2f(7, 10), a2 + b2);
    EXPECT_EQ(Vector2f(-3, -4), a2 - b2);
    EXPECT_EQ(Vector2f(10, 21), a2 * b2);
    EXPECT_EQ(Vector2f(2.5f, 3.5f), b2 / Vector2f(2, 2));
    EXPECT_EQ(Vector2f(4, 6), 2 * a2);
    EXPECT_EQ(Vector2f(1, 1.5f), a2 / 2);
    EXPECT_EQ(Vector2f(-2, -3), -a2);
    EXPECT_EQ(31, dot(a2, b2));

    const Vector3f a3(2, 3, 4), b3(5, 7, 9);
    EXPECT_EQ(Vector3f(7, 10, 13), a3 + b3);
    EXPECT_EQ(Vector3f(-3, -4, -5), a3 - b3);
    EXPECT_EQ(Vector3f(10, 21, 36), a3 * b3);
    EXPECT_EQ(Vector3f(2.5f, 3.5f, 4.5f), b3 / Vector3f(2, 2, 2));
    EXPECT_EQ(Vector3f(4, 6, 8), 2 * a3);
    EXPECT_EQ(Vector3f(1, 1.5f, 2), a3 / 2);
    EXPECT_EQ(Vector3f(-2, -3, -4), -a3);
    EXPECT_EQ(67, dot(a3, b3));
    EXPECT_EQ(Vector3f(-1, 2, -1), cross(a3, b3));

    const Vector4f a4(2, 3, 4, 5), b4(5, 7, 9, 11);
    EXPECT_EQ(Vector4f(7, 10, 13, 16), a4 + b4);
    EXPECT_EQ(Vector4f(-3, -4, -5, -6), a4 - b4);
    EXPECT_EQ(Vector4f(10, 21, 36, 55), a4 * b4);
    EXPECT_EQ(Vector4f(2.5f, 3.5f, 4.5f, 5.5f), b4 / Vector4f(2, 2, 2, 2));
    EXPECT_EQ(Vector4f(4, 6, 8, 10), 2 * a4);
    EXPECT_EQ(Vector4f(1, 1.5f, 2, 2.5f), a4 / 2);
    EXPECT_EQ(Vector4f(-2, -3, -4, -5), -a4);
    EXPECT_EQ(122, dot(a4, b4));

    for (int i = 0; i < 4; ++i)
    {
        Vector4f changed = a4;
        changed[i] += 1;
        EXPECT_NE(a4, changed) << i;
    }
}

// Fault caught: 0 / 0 in the normal of a degenerate triangle, from where NaN spreads into bounds and sorting.
TEST(Vector, normalizeLeavesAVectorWithoutLengthAlone)
{
    EXPECT_EQ(Vector2f(0.6f, 0.8f), normalize(Vector2f(3, 4)));
    EXPECT_EQ(Vector3f(0, -1, 0), normalize(Vector3f(0, -7, 0)));
    EXPECT_EQ(Vector2f(), normalize(Vector2f()));
    EXPECT_EQ(Vector3f(), normalize(Vector3f()));
    EXPECT_EQ(Vector4f(), normalize(Vector4f()));
}

TEST(Vector, textForms)
{
    const struct
    {
        std::string text;
        const char* expected;
    } cases[] = {
        {toString(Vector2f(0.5f, -1)), "Vector2f(0.5, -1)"},
        {toString(Vector3f(1, 0, 1234567)), "Vector3f(1, 0, 1.23457e+06)"},
        {toString(Vector4f(1, 2, 3, 4)), "Vector4f(1, 2, 3, 4)"},
        {toString(Vector2i(3, 4)), "Vector2i(3, 4)"},
        {toString(Vector3i(3, 4, -5)), "Vector3i(3, 4, -5)"},
        {toString(Vector4i(1, 2, 3, 1234567)), "Vector4i(1, 2, 3, 1234567)"},
        {toString(Vector2b(true, false)), "Vector2b(1, 0)"},
        {toString(Vector3b(false, false, true)), "Vector3b(0, 0, 1)"},
        {toString(Vector4b(true, false, false, true)), "Vector4b(1, 0, 0, 1)"},
    };
    for (const auto& c : cases)
        EXPECT_EQ(c.expected, c.text);
}
