#include "orv/filestreamsource.h"

#include "support/logcapture.h"
#include "support/tempdir.h"

#include <gtest/gtest.h>

#include <string>

#include <sys/stat.h>
#include <unistd.h>

using namespace orv;

// Faults caught: eof() that is already true after the last byte; a stream that is lost after a short read, so that
// "while (!eof()) read()" after seek(0) never ends.
TEST(FileStream, goesOnAfterAShortRead)
{
    const support::TempDir dir;
    dir.write("ten", std::string("0123456789"));
    const SharedPtr<Stream> stream = FileStreamSource(dir.path().c_str()).open("ten", false);
    ASSERT_TRUE(stream);
    char buffer[16] = {};
    EXPECT_EQ(10, stream->size());
    EXPECT_EQ(0, stream->tell());
    EXPECT_EQ(0, stream->read(nullptr, 4));
    EXPECT_EQ(0, stream->write("x", 1));

    EXPECT_EQ(8, stream->seek(8));
    EXPECT_EQ(2, stream->read(buffer, 2));
    EXPECT_EQ(std::string("89"), buffer);
    EXPECT_FALSE(stream->eof()) << "all read, but nothing was missing yet";
    EXPECT_EQ(10, stream->tell());
    EXPECT_TRUE(stream->valid());

    EXPECT_EQ(4, stream->seek(4));
    EXPECT_EQ(6, stream->read(buffer, 7));
    EXPECT_TRUE(stream->eof());
    EXPECT_TRUE(stream->valid());
    EXPECT_EQ(10, stream->tell());
    EXPECT_EQ(0, stream->read(buffer, 1));
    EXPECT_TRUE(stream->eof());

    EXPECT_EQ(0, stream->seek(0));
    EXPECT_FALSE(stream->eof());
    int32_t total = 0;
    for (int i = 0; i < 100 && !stream->eof(); ++i)
        total += stream->read(buffer, 3);
    EXPECT_EQ(10, total);
    EXPECT_TRUE(stream->eof());
    EXPECT_EQ(10, stream->size());
}
