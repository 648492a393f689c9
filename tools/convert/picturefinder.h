#pragma once

#include <cstdint>
#include <filesystem>
#include <string>
#include <vector>

struct aiScene;

namespace convert
{

/// A picture as a model has it.
struct FoundPicture
{
    std::string name;           ///< for people: a file name without folders and extension
    std::vector<uint8_t> bytes; ///< of a file
    bool isThere = false;
};

/// Finds the pictures of a model: inside it, in a data URI, or on disk.
class PictureFinder
{
public:
    /// @param model  the file they belong to; outlived by scene.
    PictureFinder(const aiScene& scene, const std::filesystem::path& model);

    /// @param path  as a material names it.
    FoundPicture find(const std::string& path) const;

private:
    FoundPicture findOnDisk(const std::string& path) const;

    const aiScene& m_scene;
    std::filesystem::path m_folder;
};

} // namespace convert
