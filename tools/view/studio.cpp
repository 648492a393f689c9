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
    if (std::find(m_folders.begin(), m_folders.end(), folder) != m_folders.end())
        return;
    m_folders.push_back(folder);
    m_sources.push_back(makeShared<RecordingSource>(folder));
    m_pool->registerSource(m_sources.back());
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
