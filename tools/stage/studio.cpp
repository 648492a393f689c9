#include "studio.h"

#include "orv/indexbuffercache.h"
#include "orv/meshcache.h"
#include "orv/shaderprogramcache.h"
#include "orv/texture2dcache.h"
#include "orv/texturecubecache.h"
#include "orv/vertexbuffercache.h"

#include <algorithm>

namespace view
{

using orv::makeShared;

Studio::Studio() : m_context(makeShared<orv::RenderContext>()), m_pool(makeShared<orv::AssetCachePool>()) {}

Studio::~Studio()
{
    m_context.reset();
    flush();
}

void Studio::addFolder(const std::string& folder)
{
    const auto known = std::find(m_folders.begin(), m_folders.end(), folder);
    if (known != m_folders.end())
        return m_sources[size_t(known - m_folders.begin())]->setUsed(true);
    m_folders.push_back(folder);
    m_sources.push_back(makeShared<RecordingSource>(folder));
    m_pool->registerSource(m_sources.back());
}

std::set<std::string> Studio::getFolders() const
{
    std::set<std::string> folders;
    for (size_t i = 0; i < m_folders.size(); ++i)
    {
        if (m_sources[i]->isUsed())
            folders.insert(m_folders[i]);
    }
    return folders;
}

void Studio::limitFolders(const std::set<std::string>& folders)
{
    for (size_t i = 0; i < m_folders.size(); ++i)
        m_sources[i]->setUsed(folders.count(m_folders[i]) > 0);
}

void Studio::addSource(const orv::SharedPtr<orv::StreamSource>& source)
{
    m_otherSources.push_back(makeShared<SwitchedSource>(source));
    m_pool->registerSource(m_otherSources.back());
}

void Studio::useSources(bool used)
{
    for (const orv::SharedPtr<SwitchedSource>& source : m_otherSources)
        source->setUsed(used);
}

void Studio::forgetAssets()
{
    m_pool->getMeshCache()->clear();
    m_pool->getVertexBufferCache()->clear();
    m_pool->getIndexBufferCache()->clear();
    m_pool->getShaderProgramCache()->clear();
    m_pool->getTexture2DCache()->clear();
    m_pool->getTextureCubeCache()->clear();
    for (const orv::SharedPtr<RecordingSource>& source : m_sources)
        source->forget();
}

void Studio::flush()
{
    m_pool->flush(); // meshes and programs first,
    m_pool->flush(); // then what only they held
}

std::set<std::string> Studio::getAskedFiles() const
{
    std::set<std::string> files;
    for (const orv::SharedPtr<RecordingSource>& source : m_sources)
        files.insert(source->getAsked().begin(), source->getAsked().end());
    return files;
}

} // namespace view
