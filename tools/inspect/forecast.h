#pragma once

#include "gloscan.h"

#include <cstdint>
#include <filesystem>
#include <string>
#include <vector>

namespace inspect
{

/// What the engine will create from a scene file.
struct Forecast
{
    struct Program
    {
        std::string name; ///< with its defines
        int draws = 0;    ///< of solids that it draws
    };

    std::vector<Program> programs; ///< by name
    int nodes = 0;                 ///< of the file; those with several objects become more
    int draws = 0;                 ///< one for each primitive set of each reference
    uint64_t triangles = 0;        ///< drawn with everything in view
    uint64_t vertices = 0;         ///< kept, not drawn
    uint64_t keys = 0;             ///< of all channels
    uint64_t interpolated = 0;     ///< keys of interpolated channels
    uint64_t vertexBytes = 0;      ///< of GPU buffers
    uint64_t indexBytes = 0;
    uint64_t textureBytes = 0; ///< with mipmaps; compressed pictures as their files hold them
};

Forecast forecast(const ScannedFile& file, const std::filesystem::path& folder);

} // namespace inspect
