#pragma once

#include <string>

struct aiScene;

namespace convert
{

class ModelFiles;
class Report;

/// Applies the texture transforms of an OBJ file's material library (the options -s and -o of a map), which libassimp
/// ignores. All pictures of a material use the first one's transform; a different one is reported as lost.
/// @param path  of the OBJ file.
void correctObj(aiScene& scene, const std::string& path, ModelFiles& files, Report& report);

} // namespace convert
