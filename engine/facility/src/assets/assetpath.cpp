#include "orv/detail/assetpath.h"

#include "orv/detail/loadscope.h"
#include "orv/log.h"

#include <string_view>

namespace orv::detail
{

std::string normalizeAssetName(const char* name)
{
    std::string normalized = name ? name : "";
    if (normalized.starts_with("orv:"))
    {
        normalized[3] = '#';
        ORV_LOG_WARN("Use of \"orv:\" to indicate asset namespace is deprecated; use \"orv#\" instead.");
    }
    else if (normalized.starts_with("luvane:"))
    {
        normalized[6] = '#';
        ORV_LOG_WARN(
            "Use of \"luvane:\" to indicate asset namespace is deprecated; use \"luvane#\" instead.");
    }
    return normalized;
}

AssetPath::~AssetPath() = default;

bool AssetPath::add(const char* path, bool archive)
{
    const SharedPtr<StreamSource> source = StreamSource::get(path, archive);
    return source && add(source);
}

bool AssetPath::add(const SharedPtr<StreamSource>& source)
{
    m_sources.push_back(source);
    LoadScope::forgetFailures(); // made by a source or loader of the program while it is asked
    return true;
}

bool AssetPath::remove(const char* name)
{
    if (!name)
        return false;
    for (std::size_t i = 0; i < m_sources.size(); ++i)
    {
        const StreamSource* source = m_sources[i].getLogged();
        if (!source || std::string_view(source->getName()) != name)
            continue;
        m_sources.erase(m_sources.begin() + std::ptrdiff_t(i));
        return true;
    }
    return false;
}

SharedPtr<Stream> AssetPath::find(const char* name) const
{
    if (!name || !LoadScope::mayRead())
        return {};
    // By index, each source held: opening a stream may add and remove sources.
    for (std::size_t i = 0; i < m_sources.size(); ++i)
    {
        const SharedPtr<StreamSource> entry = m_sources[i];
        StreamSource* source = entry.getLogged();
        if (source && source->exists(name))
            return source->open(name, false);
    }
    return {};
}

std::string AssetPath::describe() const
{
    std::string names;
    for (const SharedPtr<StreamSource>& source : m_sources)
    {
        if (source)
            names.append(names.empty() ? "" : ", ").append(source->getName());
    }
    return names;
}

void AssetPath::explainMissing(const char* name) const
{
    for (std::size_t i = 0; i < m_sources.size(); ++i)
    {
        const SharedPtr<StreamSource> source = m_sources[i]; // held: asking it may add and remove sources
        if (source && source->exists(name))
            return;
    }
    if (LoadScope::mayExplain())
        ORV_LOG_WARN("\"%s\" was looked for in: %s", name, describe().c_str());
}

void AssetPath::setCacheDirectory(const char* directory)
{
    m_cacheDirectory = directory ? directory : "";
}

} // namespace orv::detail
