#include "orv/detail/logbudget.h"

#include "orv/log.h"

#include "support/logcapture.h"

#include <gtest/gtest.h>

using orv::detail::LogBudget;
using support::LogCapture;

namespace
{

/// A number of records from each of a number of places in a source.
void write(int places, int records)
{
    for (int record = 0; record < records; ++record)
    {
        for (int line = 0; line < places; ++line)
            orv::detail::logError("some/source", "work", line, "record %d", record);
    }
}

} // namespace

// Faults caught: a file that makes as many records as it has lines; a flood of one kind that hides the others; records
// that go uncounted.
TEST(LogBudget, fewRecordsOfManyKinds)
{
    const struct
    {
        int places;
        int records;
        int written;
        int counting; ///< records that tell how many more there were
    } cases[] = {{1, 8, 8, 0},  {1, 9, 8, 1},    {1, 50000, 8, 1},
                 {5, 7, 35, 0}, {30, 3, 68, 22}, {500, 100, 68, 31}};
    for (const auto& test : cases)
    {
        LogCapture log;
        {
            const LogBudget budget("a.file");
            const LogBudget inner("another.file");
            write(test.places, test.records);
        }
        const auto records = log.records();
        ASSERT_EQ(size_t(test.written + test.counting), records.size()) << test.places;
        EXPECT_GE(100u, records.size());
        long total = 0;
        for (const auto& record : records)
        {
            EXPECT_EQ("some/source", "some/" + record.source);
            EXPECT_EQ('E', record.level);
            const bool isCounting = record.message.find("while loading a.file") != std::string::npos;
            total += isCounting ? std::stol(record.message) : 1;
        }
        EXPECT_EQ(long(test.places) * test.records, total) << test.places;
    }
    LogCapture log;
    write(1, 50);
    EXPECT_EQ(50, log.count('E')) << "outside of loads";
}

// Fault caught: long messages cut off.
TEST(LogBudget, longMessages)
{
    for (const size_t size : {255, 256, 100000})
    {
        LogCapture log;
        const std::string text(size, 'x');
        ORV_LOG_WARN("%s%%", text.c_str());
        EXPECT_EQ(1, log.countMessage(text + '%'));
    }
}
