#pragma once

#include "convert/report.h"

struct aiScene;

namespace convert
{

/// Replaces what is not finite, or too large to reckon with, and reports it: transforms and bind poses by the identity,
/// weights by 0. Such keys are dropped. Vertices are not looked at.
void replaceBadNumbers(aiScene& scene, Report& report);

} // namespace convert
