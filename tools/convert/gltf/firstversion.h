#pragma once

#include "document.h"

#include "convert/report.h"

struct aiScene;

namespace convert::gltf
{

/// Corrects or reports libassimp's faults with glTF 1.0 files: it composes node transforms in the wrong order, scales
/// camera angles, halves the angles of light cones, and reads neither animations nor skins.
/// @param file  the file's JSON; null for a GLB of version 1, of which only cameras and lights are corrected.
void correctFirstVersion(aiScene& scene, const Document* file, Report& report);

} // namespace convert::gltf
