#pragma once

#include <string>

struct aiScene;

namespace convert
{

class ModelFiles;

/// Puts right what libassimp makes of Half-Life models: it hangs all bones side by side, whatever their parents, and
/// makes animations last as many times too long as they have frames a second.
/// @param path  of the file that the scene comes from.
void correctHalfLife(aiScene& scene, const std::string& path, ModelFiles& files);

} // namespace convert
