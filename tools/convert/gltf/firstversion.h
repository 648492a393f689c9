#pragma once

#include "document.h"

#include "convert/report.h"

struct aiScene;

namespace convert::gltf
{

/// Puts right or reports what libassimp makes of glTF 1.0 files: it composes nodes the wrong way round, stretches the
/// angles of cameras, takes angles of lights from the axis, and reads neither animations nor skins.
/// @param file  the file's JSON; null for a GLB of version 1, of which nothing but cameras and lights are put right.
void correctFirstVersion(aiScene& scene, const Document* file, Report& report);

} // namespace convert::gltf
