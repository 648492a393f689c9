#pragma once

#include "orv/memorystreamsource.h"
#include "orv/sharedptr.h"

#include <cstdint>
#include <filesystem>
#include <map>
#include <string>

namespace inspect
{

enum class ImageState
{
    MISSING,
    UNREADABLE,
    READABLE
};

struct ImageSize
{
    ImageState state = ImageState::MISSING;
    bool isBuiltIn = false;
    unsigned width = 0; ///< of a face, for a cube
    unsigned height = 0;
    unsigned gpuBytes = 0; ///< with all faces and mipmaps

    bool isPowerOfTwo() const;
};

/// The pictures beside a scene and the engine's built-in ones, decoded by the engine.
class Images
{
public:
    explicit Images(const std::filesystem::path& folder);

    /// @param name  as a material has it.
    const ImageSize& measure(const std::string& name, bool cube);

private:
    ImageSize measureFile(const std::string& name, bool cube) const;

    std::filesystem::path m_folder;
    orv::SharedPtr<orv::MemoryStreamSource> m_builtIn[2];
    std::map<std::pair<std::string, bool>, ImageSize> m_known;
};

} // namespace inspect
