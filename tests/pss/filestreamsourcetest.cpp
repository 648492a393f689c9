#include "orv/filestreamsource.h"

#include "support/logcapture.h"
#include "support/tempdir.h"

#include <gtest/gtest.h>

#include <cstdlib>
#include <string>
#include <utility>

#include <sys/stat.h>
#include <unistd.h>

using namespace orv;

// Fault caught: names that reach something which is no stream: a directory, which opens but cannot be read, a
// pipe, which would wait for ever, or a file whose size an int32_t cannot hold.
TEST(FileStreamSource, onlyReadableFilesExist)
{
    const support::TempDir dir;
    dir.write("folder/file", std::string("x"));
    dir.write("empty", std::string());
    ASSERT_EQ(0, mkfifo(dir.path("pipe").c_str(), 0600));
    const int64_t largest = 0x7fffffff;
    ASSERT_EQ(0, truncate(dir.write("largest", std::string()).c_str(), off_t(largest)));
    ASSERT_EQ(0, truncate64(dir.write("huge", std::string()).c_str(), largest + 1));
    const std::pair<const char*, int64_t> cases[] = {
        {"folder/file", 1}, {"./folder//file", 1}, {"empty", 0},    {"largest", largest},
        {"huge", -1},       {"folder", -1},        {"folder/", -1}, {"pipe", -1},
        {"missing", -1},    {"Empty", -1},         {"", -1},        {nullptr, -1},
    }; // -1: there is no such stream

    FileStreamSource source(dir.path().c_str());
    support::LogCapture log;
    for (const auto& [name, size] : cases)
    {
        SCOPED_TRACE(name ? name : "null");
        EXPECT_EQ(size >= 0, source.exists(name));
        const SharedPtr<Stream> stream = source.open(name, false);
        EXPECT_EQ(size, stream ? stream->size() : -1);
    }
    EXPECT_EQ("", log.text()) << "what cannot be opened is for the caller to report";
}

TEST(FileStreamSource, withoutRootReadsBelowTheWorkingDirectory)
{
    const support::TempDir dir;
    dir.write("here", std::string("abc"));
    char* const before = getcwd(nullptr, 0);
    ASSERT_EQ(0, chdir(dir.path().c_str()));
    for (const char* root : {"", static_cast<const char*>(nullptr)})
    {
        FileStreamSource source(root);
        EXPECT_STREQ(".", source.getName());
        EXPECT_TRUE(source.exists("here"));
    }
    EXPECT_EQ(0, chdir(before));
    std::free(before);
}

TEST(FileStreamSource, writesWholeFilesAndPatches)
{
    const support::TempDir dir;
    dir.write("out", std::string("something longer that was there before"));
    const auto content = [&dir]
    {
        const std::vector<uint8_t> bytes = support::readFile(dir.path("out"));
        return std::string(bytes.begin(), bytes.end());
    };
    SharedPtr<Stream> stream = FileStreamSource((dir.path() + "/").c_str()).open("out", true);
    ASSERT_TRUE(stream);
    EXPECT_EQ(0, stream->size());
    EXPECT_EQ(6, stream->write("abcdef", 6));
    EXPECT_EQ(6, stream->size());
    EXPECT_EQ(0, stream->write(nullptr, 6));
    EXPECT_EQ("abcdef", content()) << "a reader sees it at once";

    EXPECT_EQ(2, stream->seek(2));
    EXPECT_EQ(2, stream->size()) << "size is the write position";
    EXPECT_EQ(1, stream->write("X", 1));
    EXPECT_EQ(3, stream->tell());
    char buffer[4];
    EXPECT_EQ(0, stream->read(buffer, 4));
    EXPECT_TRUE(stream->valid());
    stream.reset();
    EXPECT_EQ("abXdef", content());
}

// Fault caught: a full disk or a missing directory that looks like success.
TEST(FileStreamSource, whatCannotBeWrittenTakesNothing)
{
    const support::TempDir dir;
    const std::pair<std::string, const char*> cases[] = {
        {dir.path(), "missing/out"}, {dir.path(), "."}, {"/dev", "full"}};
    for (const auto& [root, file] : cases)
    {
        SCOPED_TRACE(file);
        const SharedPtr<Stream> stream = FileStreamSource(root.c_str()).open(file, true);
        ASSERT_TRUE(stream) << "an output stream is handed out even so";
        EXPECT_TRUE(stream->valid());
        EXPECT_EQ(0, stream->write("abc", 3));
        EXPECT_FALSE(stream->valid());
        EXPECT_EQ(0, stream->write("abc", 3));
    }
    EXPECT_FALSE(FileStreamSource(dir.path().c_str()).open("", true));
    EXPECT_FALSE(FileStreamSource(dir.path().c_str()).open(nullptr, true));
}

TEST(StreamSource, getKnowsDirectoriesOnly)
{
    const support::TempDir dir;
    dir.write("file", std::string("x"));
    support::LogCapture log;
    const SharedPtr<StreamSource> source = StreamSource::get(dir.path().c_str(), false);
    ASSERT_TRUE(source);
    EXPECT_TRUE(source->exists("file"));
    EXPECT_FALSE(StreamSource::get(dir.path().c_str(), true));
    EXPECT_EQ(1, log.countMessage("Archive streams are not currently supported."));
    EXPECT_EQ(1, int(log.records().size())) << log.text();
}
