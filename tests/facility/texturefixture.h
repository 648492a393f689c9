#pragma once

#include "facilitytest.h"
#include "imagefiles.h"

#include "orv/memorystreamsource.h"

#include <deque>
#include <string>

/// A cache of textures with files in memory. What a test leaves in GL beyond the cache's last flush() fails it.
template <class Cache>
class TextureFixture : public FacilityTest
{
protected:
    explicit TextureFixture(const orv::SharedPtr<Cache>& made = orv::makeShared<Cache>()) : cache(made) {}

    void SetUp() override
    {
        GlTest::SetUp();
        cache->registerSource(m_source);
    }

    void flush() override { cache->flush(); }

    void addFile(const std::string& name, const imagefiles::Bytes& file)
    {
        m_files.push_back(file);
        m_source->add(name.c_str(),
                      orv::makeShared<orv::MemoryStream>(m_files.back().data(), int(file.size())));
    }

    orv::SharedPtr<Cache> cache;

private:
    orv::SharedPtr<orv::MemoryStreamSource> m_source = orv::makeShared<orv::MemoryStreamSource>();
    std::deque<imagefiles::Bytes> m_files;
};
