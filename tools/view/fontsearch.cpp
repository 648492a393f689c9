#include "fontsearch.h"

#include <algorithm>
#include <cstdlib>
#include <filesystem>
#include <iterator>

namespace view
{

namespace fs = std::filesystem;

namespace
{

/// In order of preference.
const char* const KNOWN_FILES[] = {"DejaVuSans.ttf",
                                   "LiberationSans-Regular.ttf",
                                   "NotoSans-Regular.ttf",
                                   "Roboto-Regular.ttf",
                                   "OpenSans-Regular.ttf",
                                   "Ubuntu-R.ttf",
                                   "FreeSans.ttf",
                                   "Arial.ttf",
                                   "arial.ttf",
                                   "NotoMono-Regular.ttf",
                                   "DroidSansFallback.ttf"};

} // namespace

std::vector<std::string> getFontFolders()
{
    std::vector<std::string> folders;
    if (const char* home = std::getenv("HOME"))
    {
        folders.push_back(std::string(home) + "/.local/share/fonts");
        folders.push_back(std::string(home) + "/.fonts");
    }
    folders.emplace_back("/usr/local/share/fonts");
    folders.emplace_back("/usr/share/fonts");
    return folders;
}

std::string findFont(const std::vector<std::string>& folders)
{
    size_t bestRank = std::size(KNOWN_FILES);
    std::string best;
    for (const std::string& folder : folders)
    {
        std::error_code error;
        fs::recursive_directory_iterator entry(folder, fs::directory_options::skip_permission_denied, error);
        for (; !error && bestRank > 0 && entry != fs::recursive_directory_iterator(); entry.increment(error))
        {
            const std::string name = entry->path().filename().string();
            const size_t rank = size_t(std::find(std::begin(KNOWN_FILES), std::end(KNOWN_FILES), name) -
                                       std::begin(KNOWN_FILES));
            std::error_code reason;
            if (rank >= bestRank || !entry->is_regular_file(reason))
                continue;
            bestRank = rank;
            best = entry->path().string();
        }
    }
    return best;
}

} // namespace view
