#pragma once

#include <cstdint>
#include <map>
#include <set>
#include <string>

namespace view
{

/// Tells when files have changed on disk, by their times, sizes and identities.
class Watcher
{
public:
    /// These files from now on, which need not exist. One that was watched before counts as changed if it has
    /// changed since hasChanged() was last asked; so nothing is missed that happens while files are loaded.
    void watch(const std::set<std::string>& paths);

    /// Looks at the files. A change counts once nothing has happened between two looks, so that a file which is
    /// written in pieces is not taken half. Ask a few times a second.
    bool hasChanged();

private:
    struct Stamp
    {
        int64_t seconds = 0;
        int64_t nanoseconds = 0;
        int64_t size = -1; ///< there is no such file
        uint64_t identity = 0;

        bool operator==(const Stamp&) const = default;
    };

    static Stamp look(const std::string& path);

    std::map<std::string, Stamp> m_stamps;
    bool m_pending = false;
};

} // namespace view
