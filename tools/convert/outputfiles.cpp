#include "outputfiles.h"

#include "convert/files/filegate.h"

#include <cerrno>
#include <csignal>
#include <cstdio>
#include <cstring>
#include <filesystem>

#include <unistd.h>

namespace convert
{

namespace fs = std::filesystem;

namespace
{

/// Blocks signals such as Ctrl-C while it exists.
class Uninterrupted
{
public:
    Uninterrupted()
    {
        sigset_t signals;
        sigemptyset(&signals);
        for (const int signal : {SIGINT, SIGTERM, SIGHUP, SIGQUIT})
            sigaddset(&signals, signal);
        sigprocmask(SIG_BLOCK, &signals, &m_before);
    }
    ~Uninterrupted() { sigprocmask(SIG_SETMASK, &m_before, nullptr); }
    Uninterrupted(const Uninterrupted&) = delete;
    Uninterrupted& operator=(const Uninterrupted&) = delete;

private:
    sigset_t m_before;
};

/// Files that are removed again unless they are kept.
class TemporaryFiles
{
public:
    TemporaryFiles() = default;
    ~TemporaryFiles()
    {
        std::error_code ignored;
        for (const fs::path& path : m_paths)
            fs::remove(path, ignored);
    }
    TemporaryFiles(const TemporaryFiles&) = delete;
    TemporaryFiles& operator=(const TemporaryFiles&) = delete;

    void add(const fs::path& path) { m_paths.push_back(path); }
    void keep() { m_paths.clear(); }

private:
    std::vector<fs::path> m_paths;
};

bool fail(const std::string& path, const std::string& reason, std::string& error)
{
    error = path + ": " + reason;
    return false;
}

/// Whether it is a device, a pipe or an open file, which is written to and never replaced, by root neither.
bool isDevice(const std::string& path)
{
    std::error_code ignored;
    const fs::file_status status = fs::status(path, ignored);
    const auto begins = [&path](const char* with) { return path.rfind(with, 0) == 0; };
    return begins("/dev/std") || begins("/dev/fd/") || begins("/proc/") ||
           (fs::exists(status) && !fs::is_regular_file(status) && !fs::is_directory(status));
}

/// @param mode  of fopen().
bool writeFile(const fs::path& path, const std::vector<uint8_t>& bytes, const char* mode)
{
    std::FILE* file = std::fopen(path.c_str(), mode);
    if (!file)
        return false;
    const bool written = bytes.empty() || std::fwrite(bytes.data(), 1, bytes.size(), file) == bytes.size();
    return std::fclose(file) == 0 && written;
}

fs::path getTemporaryPath(const fs::path& target)
{
    return target.parent_path() /
           ("." + target.filename().string() + "." + std::to_string(getpid()) + ".tmp");
}

bool writeTemporaries(const std::vector<OutputFile>& files, const FileGate& inputs,
                      TemporaryFiles& temporaries, std::string& error)
{
    for (const OutputFile& file : files)
    {
        std::error_code ignored;
        if (fs::is_directory(file.path, ignored)) // checked before the first file is renamed
            return fail(file.path, std::strerror(EISDIR), error);
        if (inputs.wasOpened(file.path))
            return fail(file.path, "the model was read from this file; choose another name", error);
        const bool isReplaced = !isDevice(file.path);
        const fs::path path = isReplaced ? getTemporaryPath(file.path) : fs::path(file.path);
        if (isReplaced)
            temporaries.add(path);
        if (!writeFile(path, file.bytes, isReplaced ? "wbx" : "wb"))
            return fail(file.path, std::strerror(errno), error);
    }
    return true;
}

} // namespace

bool writeFiles(const std::vector<OutputFile>& files, const FileGate& inputs, std::string& error)
{
    const Uninterrupted uninterrupted;
    TemporaryFiles temporaries;
    TemporaryFiles added;
    if (!writeTemporaries(files, inputs, temporaries, error))
        return false;
    for (const OutputFile& file : files)
    {
        if (isDevice(file.path))
            continue; // done
        std::error_code reason;
        const bool isNew = !fs::exists(file.path, reason);
        fs::rename(getTemporaryPath(file.path), file.path, reason);
        if (reason)
            return fail(file.path, reason.message(), error);
        if (isNew)
            added.add(file.path);
    }
    added.keep();
    return true;
}

} // namespace convert
