#include "support/tempdir.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <iterator>

namespace support
{

TempDir::TempDir()
{
    std::string name = (std::filesystem::temp_directory_path() / "orv-test-XXXXXX").string();
    if (!mkdtemp(name.data()))
        ADD_FAILURE() << "cannot make a directory like " << name;
    m_path = name;
}

TempDir::~TempDir()
{
    std::error_code ignored;
    std::filesystem::remove_all(m_path, ignored);
}

std::string TempDir::write(const std::string& name, const std::string& content) const
{
    const std::string target = path(name);
    std::error_code ignored;
    std::filesystem::create_directories(std::filesystem::path(target).parent_path(), ignored);
    std::ofstream file(target, std::ios::binary);
    file.write(content.data(), std::streamsize(content.size()));
    EXPECT_TRUE(file.good()) << "cannot write " << target;
    return target;
}

std::string TempDir::write(const std::string& name, const std::vector<uint8_t>& content) const
{
    return write(name, std::string(content.begin(), content.end()));
}

bool TempDir::exists(const std::string& name) const
{
    std::error_code ignored;
    return std::filesystem::exists(path(name), ignored);
}

std::vector<std::string> TempDir::list() const
{
    std::vector<std::string> names;
    std::error_code ignored;
    for (const auto& entry : std::filesystem::directory_iterator(m_path, ignored))
        names.push_back(entry.path().filename().string());
    std::sort(names.begin(), names.end());
    return names;
}

std::vector<uint8_t> readFile(const std::string& path)
{
    std::ifstream file(path, std::ios::binary);
    EXPECT_TRUE(file.good()) << "cannot read " << path;
    return {std::istreambuf_iterator<char>(file), std::istreambuf_iterator<char>()};
}

} // namespace support
