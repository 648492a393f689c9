#include "orv/filetostring.h"

#include "orv/memorystream.h"

#include "support/tempdir.h"

#include <gtest/gtest.h>

using namespace orv;

namespace
{

/// Says that it is larger than it is.
class ShortStream : public MemoryStream
{
public:
    using MemoryStream::MemoryStream;
    int32_t size() const override { return 1000; }
};

} // namespace

// Fault caught: text behind the part that was really read.
TEST(FileToString, readsTheRestOfAStream)
{
    MemoryStream stream("0123456789", 10);
    stream.seek(4);
    FileToString text(stream);
    EXPECT_STREQ("456789", text.getStart());
    EXPECT_EQ('\0', *text.getEnd());
    EXPECT_EQ(6, text.getEnd() - text.getStart());

    ShortStream shortStream("abc", 3);
    text.read(shortStream);
    EXPECT_STREQ("abc", text.getStart());
    EXPECT_EQ(3, text.getEnd() - text.getStart());

    text.read(stream); // at its end
    EXPECT_STREQ("", text.getStart());

    EXPECT_EQ(nullptr, FileToString("no/such/file").getStart());
}
