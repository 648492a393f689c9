#pragma once

#include "convert/report.h"

struct aiScene;

namespace convert
{

/// Removes empty or meaningless objects that some of libassimp's importers leave in a scene: null nodes, meshes without
/// vertices, lights and cameras without a node, animations that move nothing. The vertices of a mesh without faces
/// become points. Numbers that are not finite are replaced (badnumbers.h).
void mend(aiScene& scene, Report& report);

} // namespace convert
