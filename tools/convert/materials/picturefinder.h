#pragma once

#include <cstdint>
#include <string>
#include <vector>

struct aiScene;

namespace convert
{

class ModelFiles;

/// A picture of a model.
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
    /// @param files  the model's; both outlive this object.
    PictureFinder(const aiScene& scene, ModelFiles& files);

    /// @param path  as a material names it.
    FoundPicture find(const std::string& path) const;

private:
    FoundPicture findOnDisk(const std::string& path) const;
    bool readOthersCase(const std::string& folder, FoundPicture& found, const std::string& name) const;

    const aiScene& m_scene;
    ModelFiles& m_files;
};

} // namespace convert
