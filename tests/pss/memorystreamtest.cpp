#include "orv/memorystreamsource.h"

#include "support/logcapture.h"

#include <gtest/gtest.h>

#include <string>

using namespace orv;

namespace
{

const char TEN[] = "0123456789";

} // namespace

// Fault caught: a read past the end of the block, from any position that seek() can lead to.
TEST(MemoryStream, readStaysWithinTheBlock)
{
    const struct
    {
        const char* name;
        unsigned seek;
        int position;
        unsigned count;
        const char* read;
        bool eof; // afterwards
    } cases[] = {
        {"whole", 0, 0, 10, "0123456789", true}, {"far more than there is", 8, 8, 0xffffffffu, "89", true},
        {"nothing", 8, 8, 0, "", false},         {"at the end", 10, 10, 1, "", true},
        {"beyond the end", 20, 10, 4, "", true}, {"a negative position", 0xfffffff0u, -16, 4, "", false},
    };
    for (const auto& c : cases)
    {
        SCOPED_TRACE(c.name);
        char buffer[16] = {};
        MemoryStream stream(TEN, 10);
        EXPECT_EQ(c.position, stream.seek(c.seek));
        const std::string expected = c.read;
        EXPECT_EQ(int32_t(expected.size()), stream.read(buffer, c.count));
        EXPECT_EQ(expected, buffer);
        EXPECT_EQ(c.position + int32_t(expected.size()), stream.tell());
        EXPECT_EQ(c.eof, stream.eof());
        EXPECT_TRUE(stream.valid());
    }
}

TEST(MemoryStream, withoutDataOrBufferNothingMoves)
{
    char buffer[4];
    EXPECT_EQ(0, MemoryStream(nullptr, 10).read(buffer, 4));
    MemoryStream stream(TEN, 10);
    EXPECT_EQ(0, stream.read(nullptr, 4));
    EXPECT_EQ(0, stream.write(TEN, 4));
    EXPECT_EQ(0, stream.tell());
}

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
