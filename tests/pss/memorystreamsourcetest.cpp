#include "orv/memorystreamsource.h"

#include "support/logcapture.h"

#include <gtest/gtest.h>

using namespace orv;

namespace
{

const char TEN[] = "0123456789";

} // namespace

// Fault caught: one reader of a built-in asset moving another's position.
TEST(MemoryStreamSource, everyOpeningStartsAnew)
{
    MemoryStreamSource source;
    const SharedPtr<MemoryStream> added = makeShared<MemoryStream>(TEN, 10);
    added->seek(5);
    source.add("a.txt", added);
    const SharedPtr<Stream> first = source.open("a.txt", false);
    ASSERT_TRUE(first);
    EXPECT_EQ(0, first->tell());
    first->seek(7);
    EXPECT_EQ(0, source.open("a.txt", false)->tell());
    EXPECT_EQ(5, added->tell());
}

TEST(MemoryStreamSource, namesAreExactAndTheFirstHolderStays)
{
    MemoryStreamSource source;
    source.add("a.txt", makeShared<MemoryStream>(TEN, 10));

    support::LogCapture log;
    EXPECT_FALSE(source.open("A.txt", false));
    EXPECT_FALSE(source.open(nullptr, false));
    EXPECT_FALSE(source.exists("./a.txt"));
    EXPECT_FALSE(source.exists(nullptr));
    EXPECT_EQ("", log.text()) << "an unknown name is for the caller to report";

    source.add("a.txt", makeShared<MemoryStream>(TEN, 3));
    EXPECT_EQ(1, log.countMessage("MemoryStream \"a.txt\" already added to source"));
    EXPECT_EQ(10, source.open("a.txt", false)->size());

    EXPECT_FALSE(source.open("a.txt", true));
    EXPECT_EQ(1, log.countMessage("MemoryStream streams cannot be writable: a.txt"));

    // Fault caught: an empty stream that is stored and followed when the name is opened.
    source.add("b.txt", nullptr);
    source.add(nullptr, makeShared<MemoryStream>(TEN, 3));
    EXPECT_FALSE(source.open("b.txt", false));
    EXPECT_EQ(4, log.count('E'));
}
