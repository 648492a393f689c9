#pragma once

#include "convert/options.h"
#include "convert/report.h"

#include "buffers.h"

#include <memory>
#include <string>

struct aiScene;

namespace convert::gltf
{

/// @param start     the file's first bytes.
/// @param isOthers  the file has the extension of another format.
/// @return whether it is worth a try to open it as glTF.
bool mayBeGltf(Span start, const std::string& path, bool isOthers);

/// A file that has been looked into.
struct Opened
{
    enum class Kind
    {
        OTHER, ///< no glTF
        FIRST, ///< glTF 1, which libassimp reads
        SECOND
    };
    Kind kind = Kind::OTHER;
    std::unique_ptr<Document> document; ///< null: of no JSON, or a GLB of version 1
};

/// Throws a Fault for a file that is named like glTF and is damaged.
Opened openGltf(Bytes file, const std::string& path);

/// Reads a glTF 2.0 file into a scene of libassimp's. The root node is there, and may have nothing to draw.
/// Colours stay shares of light; texture coordinates have v going up and lie as KHR_texture_transform has them;
/// pictures of the file's own are embedded, others named as in the file.
/// Throws a Fault for a file that cannot be read; what can be done without is reported as lost.
std::unique_ptr<aiScene> readGltf(std::unique_ptr<Document> document, FileOpener open, const Options& options,
                                  Report& report);

} // namespace convert::gltf
