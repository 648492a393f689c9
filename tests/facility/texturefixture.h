#pragma once

#include "imagefiles.h"
#include "orv/memorystreamsource.h"
#include "support/gltest.h"

#include <deque>
#include <string>

/// A cache of textures with files in memory. What a test leaves in GL beyond the cache's last flush() fails it.
template <class Cache>
class TextureFixture : public support::GlTest
{
protected:
    void SetUp() override
    {
        support::GlTest::SetUp();
        cache = orv::makeShared<Cache>();
        m_source = orv::makeShared<orv::MemoryStreamSource>();
        cache->registerSource(m_source);
    }

    void TearDown() override
    {
        cache->flush();
        EXPECT_EQ("", glcalls::describeLiveNames()) << "GL objects leaked";
        cache.reset();
        support::GlTest::TearDown();
    }

    void addFile(const std::string& name, const imagefiles::Bytes& file)
    {
        m_files.push_back(file);
        m_source->add(name.c_str(),
                      orv::makeShared<orv::MemoryStream>(m_files.back().data(), int(file.size())));
    }

    orv::SharedPtr<Cache> cache;

private:
    orv::SharedPtr<orv::MemoryStreamSource> m_source;
    std::deque<imagefiles::Bytes> m_files;
};
