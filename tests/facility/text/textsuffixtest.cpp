#include "orv/textsuffix.h"

#include <gtest/gtest.h>

using namespace orv;

TEST(TextSuffix, matches)
{
    const struct
    {
        const char* text;
        const char* suffix;
        bool exact;
        bool ignoringCase;
    } cases[] = {
        {"IMAGE.PNG", ".png", false, true}, {"g", ".png", false, false}, {"x", "", true, true},
        {"a[", "a{", false, false},         {nullptr, "", false, false}, {"a", nullptr, false, false}};
    for (const auto& test : cases)
    {
        EXPECT_EQ(test.exact, endsWith(test.text, test.suffix)) << (test.text ? test.text : "null");
        EXPECT_EQ(test.ignoringCase, endsWithI(test.text, test.suffix)) << (test.text ? test.text : "null");
    }
}
