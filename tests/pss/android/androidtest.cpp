// Runs against the real Android log and asset libraries.

#include "orv/assetmgrstreamsource.h"
#include "orv/detail/logbudget.h"
#include "orv/log.h"

#include "storedzip.h"
#include "support/tempdir.h"

#include <android/log.h>
#include <androidfw/Asset.h>
#include <androidfw/AssetManager.h>
#include <gtest/gtest.h>

#include <string>
#include <vector>

using namespace orv;

namespace
{

std::vector<std::string> g_records; ///< "priority tag: message"

/// Collects what the engine hands to the Android log; the platform's own records go where they always do.
class AndroidLog : public testing::Test
{
protected:
    void SetUp() override
    {
        g_records.clear();
        __android_log_set_minimum_priority(ANDROID_LOG_VERBOSE);
        __android_log_set_logger(
            [](const __android_logger_data* data, const char* message)
            {
                if (data->tag && std::string(data->tag).compare(0, 3, "ORV") == 0)
                    g_records.push_back(std::to_string(data->priority) + " " + data->tag + ": " + message);
                else
                    __android_log_stderr_logger(data, message);
            });
    }
    void TearDown() override { __android_log_set_logger(__android_log_stderr_logger); }
};

/// A package whose assets folder holds "forty" (40 bytes) and "sub/one" (1 byte).
class AssetMgrStreamSourceTest : public AndroidLog
{
protected:
    void SetUp() override
    {
        const std::string package = pssandroid::makeStoredZip({{"AndroidManifest.xml", "<manifest/>"},
                                                               {"assets/forty", FORTY},
                                                               {"assets/sub/one", "1"},
                                                               {"outside", "not an asset"}});
        const std::string path = m_dir.write("test.apk", package);
        ASSERT_TRUE(m_manager.addAssetPath(android::String8(path.c_str()), nullptr));
        AndroidLog::SetUp();
    }

    const std::string FORTY = "0123456789012345678901234567890123456789";
    support::TempDir m_dir;
    android::AssetManager m_manager;
    AssetMgrStreamSource m_source{&m_manager};
};

} // namespace

// Fault caught: a record under another tag or priority, by which the log's filters lose it.
TEST_F(AndroidLog, recordsCarryTagPriorityAndPlace)
{
    pssLogInit();
    pssLogError("engine/facility/src/assetpath", "open", 1, "%s %d", "one", 1);
    pssLogWarn("engine\\assetpath", "open", 2, "two%%");
    pssLogInfo("assetpath", "open", 3, "three");
    pssLogDebug("a/assetpath", "open", 4, "four");
    pssLogDeInit();
    const std::vector<std::string> expected = {
        "6 ORV: assetpath; open; 1; one 1", "5 ORV: assetpath; open; 2; two%",
        "4 ORV: assetpath; open; 3; three", "3 ORV: assetpath; open; 4; four"};
    EXPECT_EQ(expected, g_records);
}

// Fault caught: a position that follows the bytes read, with which an over-long read never reaches eof().
TEST_F(AssetMgrStreamSourceTest, positionAdvancesByTheBytesAskedFor)
{
    EXPECT_TRUE(m_source.exists("sub/one"));
    const SharedPtr<Stream> stream = m_source.open("forty", false);
    ASSERT_TRUE(stream && stream->valid());
    EXPECT_EQ(40, stream->size());
    char buffer[128] = {};
    EXPECT_EQ(40, stream->read(buffer, 100));
    EXPECT_EQ(FORTY, buffer);
    EXPECT_EQ(100, stream->tell());
    EXPECT_TRUE(stream->eof());

    EXPECT_EQ(38, stream->seek(38));
    EXPECT_FALSE(stream->eof());
    EXPECT_EQ(2, stream->read(buffer, 2));
    EXPECT_EQ("89", std::string(buffer, 2));
    EXPECT_TRUE(stream->eof());
    EXPECT_EQ(0, stream->read(nullptr, 2));
    EXPECT_EQ(0, stream->write("x", 1));
    EXPECT_EQ(40, stream->tell());
    EXPECT_EQ(-1, stream->seek(41)) << "the platform's answer";
    EXPECT_TRUE(g_records.empty());
}

TEST_F(AssetMgrStreamSourceTest, whatIsMissingIsReportedUnderItsOwnTag)
{
    EXPECT_FALSE(m_source.exists("outside"));
    EXPECT_FALSE(m_source.open("outside", false));
    const std::vector<std::string> expected = {
        "4 ORV Asset Mgr: AssetMgrStreamSource outside  could not load from apk/assets folder",
        "6 ORV Asset Mgr: AssetMgrStreamSource outside  not found"};
    EXPECT_EQ(expected, g_records);

    g_records.clear();
    EXPECT_FALSE(m_source.exists(""));
    EXPECT_FALSE(m_source.exists(nullptr));
    EXPECT_TRUE(g_records.empty());

    EXPECT_FALSE(m_source.open(nullptr, false));
    EXPECT_FALSE(m_source.open("forty", true));
    ASSERT_EQ(2u, g_records.size());
    EXPECT_EQ(0u, g_records[1].find("6 ORV: "));
    EXPECT_NE(std::string::npos, g_records[1].find("; Cannot open a ZIP stream for writing"));
}

// Fault caught: a record for each asset that a file names and the package lacks.
TEST_F(AssetMgrStreamSourceTest, fewRecordsOfOneLoad)
{
    {
        const detail::LogBudget budget("a.ap");
        for (int i = 0; i < 1000; ++i)
            EXPECT_FALSE(m_source.exists("outside"));
    }
    ASSERT_EQ(9u, g_records.size());
    EXPECT_NE(std::string::npos, g_records[8].find("992 more records like this while loading a.ap"));
}

// Fault caught: an asset that stays open with its mapping when its stream goes.
TEST_F(AssetMgrStreamSourceTest, streamsCloseTheirAssets)
{
    const int before = android::Asset::getGlobalCount();
    {
        const SharedPtr<Stream> first = m_source.open("forty", false);
        const SharedPtr<Stream> second = m_source.open("forty", false);
        EXPECT_TRUE(m_source.exists("forty"));
        EXPECT_EQ(before + 2, android::Asset::getGlobalCount());
        first->seek(7);
        EXPECT_EQ(0, second->tell());
    }
    EXPECT_EQ(before, android::Asset::getGlobalCount());
}
