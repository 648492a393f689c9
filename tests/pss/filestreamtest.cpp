#include "orv/filestreamsource.h"

#include "support/logcapture.h"
#include "support/tempdir.h"

#include <gtest/gtest.h>

#include <iterator>
#include <random>
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

// Faults caught: bytes of the wrong place where a read begins in the buffer and ends beyond it, where it ends just at
// the buffer's edge, or after seeking back; a position that does not follow.
TEST(FileStream, givesTheBytesOfAnyPlace)
{
    std::mt19937 random(7);
    std::string bytes;
    for (int i = 0; i < 50000; ++i)
        bytes.push_back(char(random()));
    const support::TempDir dir;
    dir.write("file", bytes);
    const SharedPtr<Stream> stream = FileStreamSource(dir.path().c_str()).open("file", false);
    ASSERT_TRUE(stream);
    const unsigned int counts[] = {0, 1, 3, 4, 100, 4092, 4095, 4096, 4097, 9000, 60000};
    size_t place = 0;
    for (int i = 0; i < 20000; ++i)
    {
        if (random() % 8 == 0)
        {
            place = random() % (bytes.size() + 10);
            ASSERT_EQ(int32_t(place), stream->seek(unsigned(place)));
        }
        const unsigned int count = random() % 2 ? 4 : counts[random() % std::size(counts)];
        const std::string expected = place < bytes.size() ? bytes.substr(place, count) : std::string();
        std::string buffer(count, '?');
        ASSERT_EQ(int32_t(expected.size()), stream->read(buffer.data(), count));
        ASSERT_EQ(expected, buffer.substr(0, expected.size()));
        ASSERT_EQ(expected.size() < count, stream->eof());
        place += expected.size();
        ASSERT_EQ(int32_t(place), stream->tell());
    }
}
