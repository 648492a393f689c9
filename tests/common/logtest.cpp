#include "orv/log.h"

#include "support/logcapture.h"

#include <gtest/gtest.h>

using support::LogCapture;

// Fault caught: a record in another form than the one that log filters and people's scripts read.
TEST(Log, recordForm)
{
    for (const char* file : {"engine/facility/a", "engine\\facility\\a", "engine/facility\\a", "a"})
    {
        LogCapture log;
        pssLogError(file, "f", 42, "%d of %s%%", 7, "x");
        EXPECT_EQ("E/ORV: a; f; 42; 7 of x%\n", log.text()) << file;
    }
    LogCapture log;
    pssLogInit();
    pssLogError("folder/", "f", 1, "one");
    pssLogWarn("a", "f", 2, "two");
    pssLogInfo("a", "f", 3, "three");
    pssLogDebug("a", "f", 4, "four");
    pssLogDeInit();
    EXPECT_EQ("E/ORV: ; f; 1; one\nW/ORV: a; f; 2; two\nI/ORV: a; f; 3; three\nD/ORV: a; f; 4; four\n",
              log.text());
}

namespace
{

int assertTwoThings(int value)
{
    ORV_ASSERT(value > 0);
    ORV_ASSERT(value % 2 == 0);
    return value;
}

} // namespace

// Fault caught: the condition's own '%' taken for a conversion, or an assertion that stops the program.
TEST(Log, assertionsLogTheirConditionAndGoOn)
{
    LogCapture log;
    EXPECT_EQ(-3, assertTwoThings(-3));
    EXPECT_EQ(2, assertTwoThings(2));

    const std::vector<LogCapture::Record> records = log.records();
    ASSERT_EQ(2u, records.size());
    EXPECT_EQ("ORV_ASSERT: value > 0", records[0].message);
    EXPECT_EQ("ORV_ASSERT: value % 2 == 0", records[1].message);
    EXPECT_EQ("logtest", records[0].source) << "without directories and extension";
    EXPECT_EQ("assertTwoThings", records[0].function);
}
