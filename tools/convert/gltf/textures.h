#pragma once

#include "source.h"

#include <memory>

struct aiTexture;

namespace convert::gltf
{

/// The pictures of a file that its materials use.
class Textures
{
public:
    explicit Textures(Source& source);
    ~Textures();
    Textures(const Textures&) = delete;
    Textures& operator=(const Textures&) = delete;

    /// @param texture  an element of "textures".
    /// @return the picture's path for a material: a file name, or "*" and the number of an embedded picture; empty if
    /// it cannot be read (reported).
    std::string getPath(const Object& texture);

    /// The embedded pictures, by number.
    std::vector<std::unique_ptr<aiTexture>> take();

private:
    std::optional<size_t> chooseImage(const Object& texture);
    std::string addImage(const Object& image);
    std::string addFile(const Object& image, const std::string& uri);
    std::string embed(const Object& image, Span bytes);

    Source& m_source;
    std::vector<std::unique_ptr<aiTexture>> m_embedded;
    std::map<size_t, std::string> m_paths; ///< by number of image
    std::vector<std::string> m_fileNames;  ///< of pictures on disk, without folders
};

} // namespace convert::gltf
