#pragma once

#include "options.h"
#include "report.h"

#include <assimp/Importer.hpp>
#include <assimp/scene.h>

#include <memory>
#include <string>

namespace convert
{

class ModelFiles;

/// A model as a libassimp scene, with the library's known faults corrected. Faces have one to three corners, the same
/// number for all faces of a mesh.
struct ImportedModel
{
    Assimp::Importer importer;
    std::unique_ptr<aiScene> own;   ///< for a format with its own reader
    const aiScene* scene = nullptr; ///< the importer's, or own
    bool hidesColours = false;      ///< vertex colours must not be shown
    aiMatrix4x4 toScene; ///< from the model's axes and unit to +y up and, if the unit is known, metres
};

/// @param files  outlives the model.
/// @param error  why not.
bool importModel(const std::string& path, ModelFiles& files, const Options& options, ImportedModel& model,
                 Report& report, std::string& error);

} // namespace convert
