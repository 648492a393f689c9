#pragma once

#include "source.h"

#include <memory>

struct aiScene;

namespace convert::gltf
{

/// Makes a scene of libassimp's of a file. Every node has a name of its own, faces have one to three corners, those of a
/// mesh all the same number. Throws a Fault.
std::unique_ptr<aiScene> readScene(Source& source);

} // namespace convert::gltf
