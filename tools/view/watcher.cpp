#include "watcher.h"

#include <sys/stat.h>

namespace view
{

Watcher::Stamp Watcher::look(const std::string& path)
{
    struct stat status = {};
    if (stat(path.c_str(), &status) != 0)
        return {};
    return {int64_t(status.st_mtim.tv_sec), int64_t(status.st_mtim.tv_nsec), int64_t(status.st_size),
            uint64_t(status.st_ino)};
}

void Watcher::watch(const std::set<std::string>& paths)
{
    std::map<std::string, Stamp> stamps;
    for (const std::string& path : paths)
    {
        const auto known = m_stamps.find(path);
        stamps.emplace(path, known != m_stamps.end() ? known->second : look(path));
    }
    m_stamps.swap(stamps);
}

bool Watcher::hasChanged()
{
    bool changed = false;
    for (auto& [path, stamp] : m_stamps)
    {
        const Stamp now = look(path);
        changed = changed || !(now == stamp);
        stamp = now;
    }
    const bool settled = m_pending && !changed;
    m_pending = changed;
    return settled;
}

} // namespace view
