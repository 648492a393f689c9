#pragma once

#include <cstdint>
#include <string>
#include <vector>

namespace support
{

/// A new, empty directory that goes away, with all it holds, at the end of the scope.
class TempDir
{
public:
    TempDir();
    ~TempDir();
    TempDir(const TempDir&) = delete;
    TempDir& operator=(const TempDir&) = delete;

    /// Absolute, without a slash at its end.
    const std::string& path() const { return m_path; }
    std::string path(const std::string& name) const { return m_path + "/" + name; }

    /// Writes a file (directories in name are made); @return its path.
    std::string write(const std::string& name, const std::string& content) const;
    std::string write(const std::string& name, const std::vector<uint8_t>& content) const;

    bool exists(const std::string& name) const;

    /// Names of the files directly in it, sorted.
    std::vector<std::string> list() const;

private:
    std::string m_path;
};

/// A whole file; a test failure and empty if it cannot be read.
std::vector<uint8_t> readFile(const std::string& path);

} // namespace support
