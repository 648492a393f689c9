#pragma once

#include "source.h"

#include <memory>

struct aiScene;

namespace convert::gltf
{

/// Makes a libassimp scene from a file. Node names are unique; faces have one to three corners, the same number for all
/// faces of a mesh. Throws a Fault.
std::unique_ptr<aiScene> readScene(Source& source);

} // namespace convert::gltf
