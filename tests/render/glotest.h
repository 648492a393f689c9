#pragma once

#include "gloscenes.h"
#include "support/gltest.h"
#include "support/logcapture.h"

#include "orv/assetcachepool.h"
#include "orv/glo.h"
#include "orv/memorystream.h"
#include "orv/scenenode.h"

#include <map>

/// Files held in memory, which tests may replace.
class GloTestSource : public orv::StreamSource
{
public:
    bool exists(const char* name) const override { return m_files.find(name) != m_files.end(); }

    orv::SharedPtr<orv::Stream> open(const char* name, bool) override
    {
        const std::vector<uint8_t>& file = m_files[name];
        return orv::makeShared<orv::MemoryStream>(file.data(), int(file.size()));
    }

    const char* getName() const override { return "GloTestSource"; }

    void set(const std::string& name, const std::vector<uint8_t>& file) { m_files[name] = file; }

private:
    std::map<std::string, std::vector<uint8_t>> m_files;
};

/// Writes scenes with tools/glo and loads them with the engine.
class GloTest : public support::GlTest
{
protected:
    void SetUp() override
    {
        GlTest::SetUp();
        m_pool = orv::makeShared<orv::AssetCachePool>();
        m_source = orv::makeShared<GloTestSource>();
        m_pool->registerSource(m_source);
        m_root = orv::makeShared<orv::SceneNode>();
    }

    void TearDown() override
    {
        m_root.reset();
        m_pool->flush();
        m_pool->flush();
        m_pool.reset();
        GlTest::TearDown();
    }

    static std::vector<uint8_t> write(const glo::GloScene& scene)
    {
        std::vector<uint8_t> file;
        std::string error;
        EXPECT_TRUE(glo::writeGlo(scene, file, error)) << error;
        return file;
    }

    orv::Glo::Ptr load(const std::vector<uint8_t>& file)
    {
        m_source->set("test.glo", file);
        return orv::loadGloFile(*m_pool, m_root, "test.glo", true);
    }

    orv::Glo::Ptr load(const glo::GloScene& scene) { return load(write(scene)); }

    /// Expects the one error with which the file is refused, or that it loads without any where error is empty.
    template <class File>
    orv::Glo::Ptr expectLoad(const File& file, const std::string& error, const std::string& what)
    {
        support::LogCapture log;
        const orv::Glo::Ptr loaded = load(file);
        EXPECT_EQ(error.empty(), bool(loaded)) << what << log.text();
        EXPECT_EQ(error.empty() ? 0 : 1, log.count('E')) << what << log.text();
        EXPECT_TRUE(error.empty() || log.countMessage(error) == 1) << what << log.text();
        return loaded;
    }

    orv::SharedPtr<orv::AssetCachePool> m_pool;
    orv::SharedPtr<GloTestSource> m_source;
    orv::SharedPtr<orv::SceneNode> m_root;
};
