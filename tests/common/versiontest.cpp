#include "orv/version.h"

#include <gtest/gtest.h>

#include <string>

using namespace orv;

// Fault caught: ordering by text ("0.9" after "0.14"), by the extra text, or with a later number outvoting an
// earlier one.
TEST(Version, orderedByItsNumbersAlone)
{
    const struct
    {
        Version a, b;
        int order; // the sign of a - b
    } cases[] = {
        {Version(1, 0, 0, "a"), Version(1, 0, 0, "b"), 0}, {Version(0, 14, 0, ""), Version(0, 13, 9, ""), 1},
        {Version(0, 9, 0, ""), Version(0, 14, 0, ""), -1}, {Version(1, 0, 0, ""), Version(0, 99, 99, ""), 1},
        {Version(1, 2, 3, ""), Version(1, 2, 4, ""), -1},  {Version(-1, 5, 0, ""), Version(0, 0, 0, ""), -1},
    };
    for (const auto& c : cases)
    {
        SCOPED_TRACE(std::to_string(&c - cases));
        EXPECT_EQ(c.order == 0, c.a == c.b);
        EXPECT_EQ(c.order != 0, c.a != c.b);
        EXPECT_EQ(c.order < 0, c.a < c.b);
        EXPECT_EQ(c.order > 0, c.a > c.b);
        EXPECT_EQ(c.order <= 0, c.a <= c.b);
        EXPECT_EQ(c.order >= 0, c.a >= c.b);
    }
}

TEST(Version, ownsItsExtraText)
{
    char extra[] = "rc1";
    const Version version(1, 2, 3, extra);
    extra[0] = 'X';
    EXPECT_STREQ("rc1", version.getExtra());
    EXPECT_STREQ("", Version(1, 2, 3, nullptr).getExtra());
}

TEST(Version, buildInfoNamesTheChange)
{
    const std::string info = getBuildInfo();
    EXPECT_EQ(0u, info.find("   "));
    const std::string ending = std::string(": ") + CHANGE_ID + "\n";
    EXPECT_EQ(info.size() - ending.size(), info.rfind(ending));
}
