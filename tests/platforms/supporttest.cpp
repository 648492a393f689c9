#include "support/damage.h"
#include "support/logcapture.h"
#include "support/picture.h"
#include "support/tempdir.h"

#include <cstdio>
#include <cstring>
#include <map>

using support::LogCapture;
using support::Picture;
using support::Rgba;

// Fault caught: records lost or mixed up, so that a test of a message passes without one.
TEST(LogCapture, takesRecordsApart)
{
    LogCapture log;
    std::fprintf(stderr, "E/ORV: assetpath; getStream; 42; no such; file: %s\n", "a.png");
    std::fprintf(stderr, "W/ORV: glofile; load; 7; first line\nsecond line\n");
    const auto records = log.records();
    ASSERT_EQ(2u, records.size());
    EXPECT_EQ('E', records[0].level);
    EXPECT_TRUE(records[0].source == "assetpath" && records[0].function == "getStream" &&
                records[0].line == 42);
    EXPECT_EQ("no such; file: a.png", records[0].message);
    EXPECT_EQ("first line\nsecond line", records[1].message);
    EXPECT_EQ(1, log.count('E'));
    EXPECT_TRUE(log.contains("second"));
    EXPECT_EQ(0, log.countMessage("first line"));

    log.clear();
    EXPECT_EQ("", log.text());
}

// Fault caught: an inner capture that swallows the outer one's records, or what is no record (a sanitizer's
// or driver's message) gone without a trace.
TEST(LogCapture, nestsAndPassesOnWhatIsNoRecord)
{
    LogCapture outer;
    std::fprintf(stderr, "I/ORV: a; b; 1; before\n");
    {
        LogCapture inner;
        std::fprintf(stderr, "driver: something\nE/ORV: a; b; 2; inside\n");
        EXPECT_EQ(1, inner.count('E'));
    }
    std::fprintf(stderr, "I/ORV: a; b; 3; behind\n");
    EXPECT_EQ(0, outer.count('E'));
    EXPECT_EQ(2, outer.count('I'));
    EXPECT_NE(std::string::npos, outer.text().find("driver: something"));
}

// Fault caught: a comparison that lets a wrong picture pass or says nothing of what is wrong.
TEST(Picture, comparisonHoldsItsTolerance)
{
    const Picture expected = Picture::filled(10, 10, {100, 100, 100, 255});
    const Picture slightly = Picture::filled(10, 10, {102, 98, 100, 255});
    Picture spot = expected;
    spot.setPixel(3, 4, {255, 0, 0, 255});
    const Picture clear = Picture::filled(10, 10, {100, 100, 100, 0});
    const Picture small = Picture::filled(5, 10, {100, 100, 100, 255});

    const struct
    {
        const char* name;
        const Picture& actual;
        support::Tolerance tolerance;
        const char* complaint;
    } cases[] = {
        {"equal", expected, {0, 0.0}, ""},
        {"within", slightly, {2, 0.0}, ""},
        {"beyond", slightly, {1, 0.99}, "100 of 100"},
        {"one spot allowed", spot, {0, 0.01}, ""},
        {"one spot", spot, {0, 0.009}, "first at 3, 4"},
        {"alpha counts", clear, {2, 0.0}, "largest 255"},
        {"size", small, {255, 1.0}, "5 x 10"},
    };
    support::TempDir directory;
    for (const auto& c : cases)
    {
        const std::string path = directory.path(c.name);
        const testing::AssertionResult result = comparePictures(path, expected, c.actual, c.tolerance);
        EXPECT_EQ(!*c.complaint, bool(result)) << c.name;
        EXPECT_NE(nullptr, std::strstr(result.message(), c.complaint)) << c.name << result.message();
        EXPECT_EQ(!result, directory.exists(std::string(c.name) + "-actual.png")) << c.name;
    }
}

// Fault caught: a kind of damage that is never done, or one that cannot be repeated.
TEST(Damage, coversEveryPlaceAndRepeatsItself)
{
    support::Bytes file(100);
    for (size_t i = 0; i < file.size(); ++i)
        file[i] = uint8_t(i + 1);
    std::vector<support::Bytes> runs[2];
    std::map<std::string, int> kinds;
    for (auto& run : runs)
        support::forEachDamage(file, 10,
                               [&](const support::Bytes& damaged, const std::string& what)
                               {
                                   EXPECT_NE(file, damaged) << what;
                                   ++kinds[what.substr(0, what.find(' '))];
                                   run.push_back(damaged);
                               });
    EXPECT_EQ(runs[0], runs[1]);
    const std::map<std::string, int> expected = {
        {"cut", 200}, {"byte", 60}, {"number", 240}, {"splice", 80}, {"random", 20}};
    EXPECT_EQ(expected, kinds);
}
