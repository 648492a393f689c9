#pragma once

#include "glo/glowriter.h"
#include "options.h"
#include "report.h"
#include "textures.h"

#include <string>
#include <vector>

namespace convert
{

/// A model as it is to be written.
struct ConvertedModel
{
    glo::GloScene scene;
    std::vector<OutputFile> textures;
    Report report;
    unsigned nodeCount = 0; ///< of the model; the scene has some more
    size_t vertexCount = 0;
    size_t triangleCount = 0;
};

/// Reads a model file and makes a scene of it.
/// @param stem   names the scene and begins the names of its pictures.
/// @param error  why not.
bool convertModel(const std::string& path, const std::string& stem, const Options& options,
                  ConvertedModel& model, std::string& error);

} // namespace convert
