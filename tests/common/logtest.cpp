#include "orv/log.h"

#include "orv/detail/logbudget.h"
#include "orv/logsink.h"
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

// Faults caught: a record that goes both ways or neither, one below the level that uses up a load's budget, text that is
// cut or taken for a format.
TEST(Log, goesWhereTheApplicationWants)
{
    using orv::LogLevel;
    std::string received;
    const orv::LogFunction receive = [](LogLevel level, const char* place, const char* text, void* user) {
        static_cast<std::string*>(user)->append(std::to_string(int(level)) + "|" + place + "|" + text + "\n");
    };

    LogCapture log;
    orv::setLogFunction(receive, &received);
    pssLogDebug("a/b", "f", 1, "100%% of %s", "it %d");
    const std::string text(1000, 'x');
    pssLogError("c", "g", 2, "%s", text.c_str());
    EXPECT_EQ("0|b; f; 1|100% of it %d\n3|c; g; 2|" + text + "\n", received);
    EXPECT_EQ("", log.text());

    received.clear();
    orv::setLogLevel(LogLevel::WARNING);
    {
        const orv::detail::LogBudget budget("a file");
        for (int i = 0; i < 200; ++i)
            orv::detail::logInfo("c", "g", i, "info");
        orv::detail::logWarn("c", "g", 1000, "warning");
    }
    EXPECT_EQ("2|c; g; 1000|warning\n", received);

    orv::setLogLevel(LogLevel::NONE);
    pssLogError("c", "g", 3, "silent");
    orv::setLogLevel(LogLevel::DEBUGGING);
    orv::setLogFunction(nullptr);
    pssLogInfo("c", "g", 4, "back");
    EXPECT_EQ("I/ORV: c; g; 4; back\n", log.text());
}
