#pragma once

#include "report.h"

struct aiScene;

namespace convert
{

/// Applies the transforms that a glTF 2.0 file has for its pictures to the meshes' texture coordinates, and takes them out
/// of the materials: libassimp's own step turns around another point and in another order.
/// All pictures of a material get the transform of the first; where they have another one, that is reported.
void transformTextureCoordinates(aiScene& scene, Report& report);

} // namespace convert
