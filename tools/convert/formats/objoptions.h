#pragma once

#include <string>

struct aiScene;

namespace convert
{

class ModelFiles;
class Report;

/// Applies how an OBJ file's material library has pictures stretched and moved (the options -s and -o of a map), which
/// libassimp reads over. All pictures of a material lie as its first does; another one's own way is reported as lost.
/// @param path  of the OBJ file.
void correctObj(aiScene& scene, const std::string& path, ModelFiles& files, Report& report);

} // namespace convert
