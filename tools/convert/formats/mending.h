#pragma once

#include "convert/report.h"

struct aiScene;

namespace convert
{

/// Takes out of a scene what some of libassimp's importers leave in it that is empty or meaningless, so that the rest can be
/// used: nodes that are null pointers, meshes without vertices, lights and cameras without a node, animations that move
/// nothing. The vertices of a mesh without faces become points.
void mend(aiScene& scene, Report& report);

} // namespace convert
