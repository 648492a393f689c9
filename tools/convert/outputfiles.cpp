#include "outputfiles.h"

#include <cerrno>
#include <cstdio>
#include <cstring>
#include <filesystem>

#include <unistd.h>

namespace convert
{

namespace fs = std::filesystem;

namespace
{

bool writeFile(const fs::path& path, const std::vector<uint8_t>& bytes)
{
    std::FILE* file = std::fopen(path.c_str(), "wb");
    if (!file)
        return false;
    const bool written = std::fwrite(bytes.data(), 1, bytes.size(), file) == bytes.size();
    return std::fclose(file) == 0 && written;
}

void remove(const std::vector<fs::path>& paths)
{
    std::error_code ignored;
    for (const fs::path& path : paths)
        fs::remove(path, ignored);
}

} // namespace

bool writeFiles(const std::string& folder, const std::vector<const OutputFile*>& files, std::string& error)
{
    const fs::path base = folder.empty() ? "." : folder;
    std::vector<fs::path> temporaries;
    for (const OutputFile* file : files)
    {
        temporaries.push_back(base / ("." + file->name + "." + std::to_string(getpid()) + ".tmp"));
        if (!writeFile(temporaries.back(), file->bytes))
        {
            error = (fs::path(folder) / file->name).string() + ": " + std::strerror(errno);
            remove(temporaries);
            return false;
        }
    }
    std::vector<fs::path> added;
    for (size_t i = 0; i < files.size(); ++i)
    {
        const fs::path target = base / files[i]->name;
        std::error_code reason;
        const bool isNew = !fs::exists(target, reason);
        fs::rename(temporaries[i], target, reason);
        if (reason)
        {
            error = (fs::path(folder) / files[i]->name).string() + ": " + reason.message();
            remove(temporaries);
            remove(added);
            return false;
        }
        if (isNew)
            added.push_back(target);
    }
    return true;
}

} // namespace convert
