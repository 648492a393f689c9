#include "page.h"

#include <filesystem>
#include <fstream>
#include <iterator>

#include <nlohmann/json.hpp>

namespace convert
{

namespace fs = std::filesystem;

namespace
{

/// The last is the one that a browser asks for.
const char* const PARTS[] = {"orv.wasm",  "orv.js",     "files.js",  "input.js",
                             "viewer.js", "viewer.css", "index.html"};
const char* const PLACES[] = {"../share/orv/web", "../../../web/page"}; // relative to the program's folder

/// The placeholder for a scene in index.html.
const char* const NO_SCENE = ">{}</script>";

fs::path findFolder()
{
    std::error_code error;
    const fs::path self = fs::read_symlink("/proc/self/exe", error);
    for (const char* const place : PLACES)
    {
        const fs::path folder = (self.parent_path() / place).lexically_normal();
        if (fs::exists(folder / PARTS[0], error))
            return folder;
    }
    return {};
}

bool read(const fs::path& path, std::vector<uint8_t>& bytes)
{
    std::ifstream file(path, std::ios::binary);
    bytes.assign(std::istreambuf_iterator<char>(file), {});
    return file.good() || file.eof();
}

/// JSON for a script element: no text in it can end the element.
std::string describeScene(const std::vector<OutputFile>& files)
{
    nlohmann::ordered_json scene;
    scene["model"] = fs::path(files.back().path).filename().string();
    scene["files"] = nlohmann::ordered_json::array();
    for (const OutputFile& file : files)
        scene["files"].push_back(fs::path(file.path).filename().string());
    std::string text = scene.dump(-1, ' ', true, nlohmann::ordered_json::error_handler_t::replace);
    for (size_t at = 0; (at = text.find('<', at)) != std::string::npos;)
        text.replace(at, 1, "\\u003c");
    return text;
}

} // namespace

bool Page::load(std::string& error)
{
    m_parts.clear();
    const fs::path folder = findFolder();
    for (const char* const name : PARTS)
    {
        m_parts.push_back({name, {}});
        if (folder.empty() || !read(folder / name, m_parts.back().bytes) || m_parts.back().bytes.empty())
        {
            error = folder.empty() ? "the page for browsers has not been built; ./run web builds it"
                                   : (folder / name).string() + ": is missing; ./run web builds it again";
            return false;
        }
    }
    const std::vector<uint8_t>& index = m_parts.back().bytes;
    if (std::string_view(reinterpret_cast<const char*>(index.data()), index.size()).find(NO_SCENE) !=
        std::string_view::npos)
        return true;
    error = (folder / PARTS[std::size(PARTS) - 1]).string() + ": has no place for a scene";
    return false;
}

void Page::addTo(std::vector<OutputFile>& files) const
{
    const std::string scene = describeScene(files);
    const fs::path folder = fs::path(files.back().path).parent_path();
    for (const OutputFile& part : m_parts)
        files.push_back({(folder / part.path).string(), part.bytes});
    std::vector<uint8_t>& bytes = files.back().bytes;
    std::string index(bytes.begin(), bytes.end());
    index.replace(index.find(NO_SCENE) + std::string_view(NO_SCENE).find("{}"), 2, scene);
    bytes.assign(index.begin(), index.end());
}

} // namespace convert
