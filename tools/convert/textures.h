#pragma once

#include "report.h"

#include <cstdint>
#include <filesystem>
#include <map>
#include <set>
#include <string>
#include <utility>
#include <vector>

struct aiScene;
struct aiTexture;

namespace convert
{

/// A file to be written beside the scene.
struct OutputFile
{
    std::string name;
    std::vector<uint8_t> bytes;
};

struct TextureUse
{
    std::string name;      ///< of the file that the scene is to name; empty if the picture cannot be had
    bool hasAlpha = false; ///< some of it is transparent, some is not
};

/// Finds the pictures of a model, on disk or inside it, and makes them files that the engine shows right.
///
/// Pictures are passed on as they are where the engine reads them; grey ones, which it would take for opacity,
/// unusual formats, and sizes that GL cannot repeat become PNG.
class TextureStore
{
public:
    /// @param model  the file they belong to.
    /// @param stem   begins every name, so that two conversions into one folder keep apart.
    TextureStore(const aiScene& scene, const std::filesystem::path& model, const std::string& stem,
                 Report& report);

    /// @param path     as a material names it.
    /// @param repeats  coordinates leave the picture, so its sizes have to be powers of two.
    TextureUse add(const std::string& path, bool repeats);

    const std::vector<OutputFile>& getFiles() const { return m_files; }

private:
    TextureUse make(const std::string& path, bool repeats);
    TextureUse makeRaw(const std::string& path, const aiTexture& texture);
    bool readFile(const std::string& path, std::vector<uint8_t>& bytes) const;
    std::string makeName(const std::string& path, const std::string& extension);

    const aiScene& m_scene;
    std::filesystem::path m_folder;
    std::string m_stem;
    Report& m_report;
    std::map<std::pair<std::string, bool>, TextureUse> m_known;
    std::set<std::string> m_names;
    std::vector<OutputFile> m_files;
};

} // namespace convert
