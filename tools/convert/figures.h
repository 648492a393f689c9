#pragma once

#include "glo/glowriter.h"
#include "report.h"

struct aiScene;

namespace convert
{

/// Counts what a model has, as it was imported.
void countModel(const aiScene& model, Report& report);

/// Counts what a scene has.
void countScene(const glo::GloScene& scene, Report& report);

} // namespace convert
