#include "filegate.h"

#include <algorithm>
#include <cerrno>

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

namespace convert
{

namespace fs = std::filesystem;

namespace
{

constexpr size_t MOST_MISSING = 1000; // limits the list of one model

bool isWithin(const fs::path& path, const fs::path& folder)
{
    return std::mismatch(folder.begin(), folder.end(), path.begin(), path.end()).first == folder.end();
}

} // namespace

FileGate::FileGate(const std::string& model, const std::vector<std::string>& allowed)
{
    const fs::path own = fs::path(model).parent_path();
    std::vector<fs::path> folders = {own.empty() ? fs::path(".") : own};
    folders.insert(folders.end(), allowed.begin(), allowed.end());
    for (const fs::path& folder : folders)
    {
        std::error_code reason;
        const fs::path canonical = fs::canonical(folder, reason);
        if (!reason)
            m_folders.push_back(canonical);
    }
    std::error_code ignored; // opening a missing model fails later
    m_model = fs::canonical(model, ignored);
}

int FileGate::open(const std::string& path, int& descriptor)
{
    std::error_code reason;
    const fs::path canonical = fs::canonical(path.c_str(), reason); // up to a NUL, like the system
    if (reason)
    {
        std::error_code ignored;
        if (reason == std::errc::no_such_file_or_directory && m_missing.size() < MOST_MISSING)
            m_missing.insert(fs::absolute(path.c_str(), ignored).string());
        return reason.value();
    }
    if (!fs::is_regular_file(canonical, reason))
        return EISDIR;
    if (!isAllowed(canonical))
        return REFUSED;
    const int opened = ::open(canonical.c_str(), O_RDONLY | O_CLOEXEC | O_NOFOLLOW | O_NONBLOCK);
    if (opened < 0)
        return errno;
    struct stat status = {};
    fstat(opened, &status);
    m_identities.emplace(status.st_dev, status.st_ino);
    m_opened.insert(canonical);
    descriptor = opened;
    return 0;
}

std::vector<std::string> FileGate::list(const std::string& folder) const
{
    std::error_code reason;
    const fs::path canonical = fs::canonical(folder.c_str(), reason);
    std::vector<std::string> names;
    if (reason || !isAllowed(canonical))
        return names;
    for (const fs::directory_entry& entry : fs::directory_iterator(canonical, reason))
        names.push_back(entry.path().filename().string());
    std::sort(names.begin(), names.end()); // folders are unordered
    return names;
}

bool FileGate::wasOpened(const std::string& path) const
{
    struct stat status = {};
    return stat(path.c_str(), &status) == 0 && m_identities.count({status.st_dev, status.st_ino}) > 0;
}

bool FileGate::isAllowed(const fs::path& canonical) const
{
    return canonical == m_model ||
           std::any_of(m_folders.begin(), m_folders.end(),
                       [&](const fs::path& folder) { return isWithin(canonical, folder); });
}

} // namespace convert
