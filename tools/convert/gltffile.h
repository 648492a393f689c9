#pragma once

#include "report.h"

#include <string>

struct aiScene;

namespace convert
{

class ModelFiles;

/// Puts right or reports what libassimp makes of glTF files. It reads values that step as if they moved in straight
/// lines, and cubic splines without their tangents; of glTF 1.0 it composes nodes the wrong way round and reads
/// neither animations nor skins.
/// @param path  of the file, ".gltf" or ".glb", that the scene comes from.
void correctGltf(aiScene& scene, const std::string& path, bool isFirstVersion, ModelFiles& files,
                 Report& report);

} // namespace convert
