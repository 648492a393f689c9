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

/// A model in libassimp's terms, put right where the library is known to hand over something else than the file has.
/// Faces have one to three corners, those of one mesh all the same number.
struct ImportedModel
{
    Assimp::Importer importer;
    std::unique_ptr<aiScene> own;   ///< of a format that is read without the importer
    const aiScene* scene = nullptr; ///< the importer's, or own
    bool hidesColours = false;      ///< those of vertices are not meant to be seen
    aiMatrix4x4
        toScene; ///< from the model's axes and unit to +y up and, where the file tells its unit, metres
};

/// @param files  outlives the model.
/// @param error  why not.
bool importModel(const std::string& path, ModelFiles& files, const Options& options, ImportedModel& model,
                 Report& report, std::string& error);

} // namespace convert
