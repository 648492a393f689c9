#pragma once

#include <string>

struct aiScene;

namespace convert
{

class ModelFiles;

/// Corrects Half-Life models: libassimp ignores the hierarchy of bones, and makes animations too long by the factor of
/// their frames a second.
/// @param path  of the file that the scene comes from.
void correctHalfLife(aiScene& scene, const std::string& path, ModelFiles& files);

} // namespace convert
