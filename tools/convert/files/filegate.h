#pragma once

#include <filesystem>
#include <set>
#include <string>
#include <utility>
#include <vector>

#include <sys/types.h>

namespace convert
{

/// Decides which files a model may reach, and opens them: those in the model's own folder and below it, or in folders
/// that the user allows. The target of a symbolic link counts. All reading of models goes through this, even from
/// another process (see runGuarded), so that an untrusted model cannot read other files.
class FileGate
{
public:
    /// open()'s result for a file elsewhere; other results are 0 or values of errno.
    static constexpr int REFUSED = -1;

    /// @param model    the file that the user named, which may be a link to anywhere.
    /// @param allowed  further folders.
    explicit FileGate(const std::string& model, const std::vector<std::string>& allowed = {});

    /// Opens a regular file for reading.
    /// @param path        absolute or from the current folder.
    /// @param descriptor  the file's, to be closed by the caller; unchanged unless it is open.
    /// @return 0, REFUSED, EISDIR if it is not a regular file, or another value of errno.
    int open(const std::string& path, int& descriptor);

    /// @return the names in a folder, sorted; none if it is elsewhere or does not exist.
    std::vector<std::string> list(const std::string& folder) const;

    /// Whether a path leads to a file that was opened here, under any name.
    bool wasOpened(const std::string& path) const;

    /// Canonical paths of the files that were opened.
    const std::set<std::filesystem::path>& getOpened() const { return m_opened; }

    /// Absolute paths of the model's missing files; the first thousand.
    const std::set<std::string>& getMissing() const { return m_missing; }

private:
    bool isAllowed(const std::filesystem::path& canonical) const;

    std::filesystem::path m_model;                ///< canonical, as the next two
    std::vector<std::filesystem::path> m_folders; ///< whose contents are allowed
    std::set<std::filesystem::path> m_opened;
    std::set<std::string> m_missing;
    std::set<std::pair<dev_t, ino_t>> m_identities; ///< of the files that were opened
};

} // namespace convert
