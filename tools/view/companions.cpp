#include "companions.h"

#include <cstring>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <vector>

namespace view
{

namespace fs = std::filesystem;

namespace
{

constexpr int MAX_DEPTH = 2;                 // folders within folders
constexpr size_t MAX_FILES = 2000;           // a folder with more is not a model's folder
constexpr uintmax_t MAX_TEXT_SIZE = 1 << 20; // bytes of a text file that is searched

std::string read(const fs::path& path)
{
    std::ifstream file(path, std::ios::binary);
    return std::string(std::istreambuf_iterator<char>(file), std::istreambuf_iterator<char>());
}

std::vector<fs::path> listFiles(const fs::path& folder)
{
    std::vector<fs::path> files;
    std::error_code error;
    fs::recursive_directory_iterator entry(folder, fs::directory_options::skip_permission_denied, error);
    for (; !error && files.size() < MAX_FILES && entry != fs::recursive_directory_iterator();
         entry.increment(error))
    {
        if (entry.depth() >= MAX_DEPTH)
            entry.disable_recursion_pending();
        std::error_code reason;
        if (entry->is_regular_file(reason))
            files.push_back(entry->path());
    }
    return files;
}

} // namespace

std::set<std::string> findCompanions(const std::string& model)
{
    const fs::path path(model);
    const std::vector<fs::path> files =
        listFiles(path.has_parent_path() ? path.parent_path() : fs::path("."));
    std::set<std::string> found = {model};
    std::vector<fs::path> unread = {path};
    while (!unread.empty())
    {
        const std::string text = read(unread.back());
        unread.pop_back();
        for (const fs::path& file : files)
        {
            const std::string name = file.filename().string();
            if (name == path.filename() || !memmem(text.data(), text.size(), name.data(), name.size()) ||
                !found.insert(file.string()).second)
                continue;
            std::error_code error;
            if (fs::file_size(file, error) <= MAX_TEXT_SIZE && !error)
                unread.push_back(file);
        }
    }
    return found;
}

} // namespace view
