#include "orv/vector.h"

#include "support/logcapture.h"

#include <gtest/gtest.h>

#include <string>
#include <utility>

using namespace orv;

namespace
{

/// Every component of two vectors is different, so one that is forgotten or exchanged shows.
template <class Vector>
void expectEveryComponent(int size)
{
    Vector a, b;
    for (int i = 0; i < size; ++i)
    {
        a[i] = float(2 + i);
        b[i] = float(5 + 2 * i);
    }
    float product = 0;
    for (int i = 0; i < size; ++i)
    {
        const float x = a[i], y = b[i];
        const float expected[] = {x + y, x - y, x * y, y / x, 2 * x, x / 2, -x};
        const Vector results[] = {a + b, a - b, a * b, b / a, 2 * a, a / 2, -a};
        for (size_t j = 0; j < 7; ++j)
            EXPECT_EQ(expected[j], results[j][i]) << j << ' ' << i;
        product += x * y;
        Vector changed = a;
        changed[i] += 1;
        EXPECT_NE(a, changed) << i;
    }
    EXPECT_EQ(product, dot(a, b));
}

} // namespace

// Fault caught: an index taken from a file or a loop read beyond the vector.
TEST(Vector, indexOutOfRangeIsLoggedAndGivesTheFirstComponent)
{
    Vector4i four(30, 31, 32, 33);
    support::LogCapture log;
    for (int i = 0; i < 4; ++i)
        EXPECT_EQ(30 + i, four[i]);
    EXPECT_EQ(11, Vector2f(10, 11)[1]);
    EXPECT_EQ(21, Vector3f(20, 21, 22)[1]);
    EXPECT_EQ(10, Vector2f(10, 11)[2]);
    EXPECT_EQ(20, Vector3f(20, 21, 22)[3]);
    four[-1] = 5;
    EXPECT_EQ(Vector4i(5, 31, 32, 33), four);
    for (const char* message :
         {"(2) out of range [0, 1]", "(3) out of range [0, 2]", "(-1) out of range [0, 3]"})
        EXPECT_EQ(1, log.countMessage(std::string("Index ") + message)) << log.text();
    EXPECT_EQ(3, log.count('E'));
}

// Fault caught: a component forgotten or exchanged in one of the many near-identical lines.
TEST(Vector, operatorsReachEveryComponent)
{
    expectEveryComponent<Vector2f>(2);
    expectEveryComponent<Vector3f>(3);
    expectEveryComponent<Vector4f>(4);
    EXPECT_EQ(Vector3f(-1, 2, -1), cross(Vector3f(2, 3, 4), Vector3f(5, 7, 9)));
}

// Fault caught: 0 / 0 in the normal of a degenerate triangle, from where NaN spreads into bounds and sorting.
TEST(Vector, normalizeLeavesAVectorWithoutLengthAlone)
{
    EXPECT_EQ(Vector3f(0, -1, 0), normalize(Vector3f(0, -7, 0)));
    EXPECT_EQ(Vector3f(), normalize(Vector3f()));
    EXPECT_EQ(Vector4f(), normalize(Vector4f()));
}

TEST(Vector, textForms)
{
    const std::pair<std::string, const char*> cases[] = {
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
    for (const auto& [text, expected] : cases)
        EXPECT_EQ(expected, text);
}
