#include "support/damage.h"
#include "support/logcapture.h"
#include "support/picture.h"
#include "support/tempdir.h"

#include <cstdio>
#include <cstring>

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

TEST(Damage, coversEveryByteAndRepeatsItself)
{
    const support::Bytes file(100, 0x55);
    std::vector<size_t> lengths;
    support::forEachCut(
        file,
        [&](const support::Bytes& cut, size_t length)
        { lengths.push_back(cut.size() == length ? length : 999); },
        10);
    EXPECT_EQ(64u + 3u + 1u, lengths.size()); // 0 to 63, 70, 80, 90 and the last
    EXPECT_EQ(99u, lengths.back());

    size_t spoiledCount = 0;
    support::forEachSpoiledByte(file, [&](const support::Bytes& spoiled, size_t offset)
                                { spoiledCount += spoiled != file && spoiled[offset] != 0x55; });
    EXPECT_EQ(300u, spoiledCount);

    std::vector<support::Bytes> runs[2];
    for (auto& run : runs)
        support::forEachRandomDamage(file, 5,
                                     [&](const support::Bytes& spoiled, int) { run.push_back(spoiled); });
    EXPECT_EQ(5u, runs[0].size());
    EXPECT_EQ(runs[0], runs[1]);
    EXPECT_NE(runs[0][0], runs[0][1]);
}
