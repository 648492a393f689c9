#pragma once

#include "convert/materials/textures.h"
#include "convert/scene/animations.h"
#include "glo/glowriter.h"
#include "options.h"
#include "report.h"

#include <string>
#include <vector>

namespace convert
{

class ModelFiles;

/// A converted model, to be written.
struct ConvertedModel
{
    glo::GloScene scene;
    std::vector<OutputFile> textures;
    std::vector<ModelClip> clips; ///< on the scene's time line, in its order
    Report report;
};

/// Reads a model file and makes a scene of it.
/// @param stem   names the scene and begins the names of its pictures.
/// @param error  why not.
bool convertModel(const std::string& path, ModelFiles& files, const std::string& stem, const Options& options,
                  ConvertedModel& model, std::string& error);

} // namespace convert
