#pragma once

#include <cstdint>
#include <map>
#include <set>
#include <string>

namespace view
{

/// Detects changes of files on disk, by their times, sizes and inode numbers.
class Watcher
{
public:
    /// Watches these files from now on; they need not exist. A file watched before counts as changed if it has changed
    /// since the last hasChanged(); so no change during a load is missed.
    void watch(const std::set<std::string>& paths);

    /// Polls the files. A change is reported when two polls in a row see the same state, so that half-written files are
    /// not read. Call it a few times a second.
    bool hasChanged();

private:
    struct Stamp
    {
        int64_t seconds = 0;
        int64_t nanoseconds = 0;
        int64_t size = -1; ///< -1: there is no such file
        uint64_t identity = 0;

        bool operator==(const Stamp&) const = default;
    };

    static Stamp look(const std::string& path);

    std::map<std::string, Stamp> m_stamps;
    bool m_pending = false;
};

} // namespace view
