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
