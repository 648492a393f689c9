#include "orv/detail/assetpath.h"

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
    return true;
}

bool AssetPath::remove(const char* name)
{
    if (!name)
        return false;
    for (auto i = m_sources.begin(); i != m_sources.end(); ++i)
    {
        const StreamSource* source = i->operator->(); // logs an empty one
        if (!source || std::string_view(source->getName()) != name)
            continue;
        m_sources.erase(i);
        return true;
    }
    return false;
}

SharedPtr<Stream> AssetPath::find(const char* name) const
{
    if (!name)
        return {};
    for (const SharedPtr<StreamSource>& entry : m_sources)
    {
        StreamSource* source = entry.operator->(); // logs an empty one
        if (source && source->exists(name))
            return source->open(name, false);
    }
    return {};
}

void AssetPath::setCacheDirectory(const char* directory)
{
    m_cacheDirectory = directory ? directory : "";
}

} // namespace orv::detail
