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
/// @return whether it may be glTF.
bool mayBeGltf(Span start, const std::string& path, bool isOthers);

/// The result of opening a file.
struct Opened
{
    enum class Kind
    {
        OTHER, ///< not glTF
        FIRST, ///< glTF 1, which libassimp reads
        SECOND
    };
    Kind kind = Kind::OTHER;
    std::unique_ptr<Document> document; ///< null without JSON, or for a GLB of version 1
};

/// Throws a Fault for a damaged file with an extension of glTF.
Opened openGltf(Bytes file, const std::string& path);

/// Reads a glTF 2.0 file into a libassimp scene. It has a root node, but perhaps nothing to draw. Colours stay linear;
/// texture coordinates have v up and KHR_texture_transform applied. The file's own pictures are embedded, others named
/// as in the file. Throws a Fault for a file that cannot be read; optional parts that cannot be read are reported as
/// lost.
std::unique_ptr<aiScene> readGltf(std::unique_ptr<Document> document, FileOpener open, const Options& options,
                                  Report& report);

} // namespace convert::gltf
