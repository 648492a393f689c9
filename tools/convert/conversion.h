#pragma once

#include "options.h"
#include "outputfiles.h"

#include <cstdio>
#include <string>
#include <vector>

namespace convert
{

class ModelFiles;

/// All that comes of converting a model; nothing is written yet.
struct Conversion
{
    std::string error;             ///< why nothing comes of it; empty if something does
    std::vector<OutputFile> files; ///< textures, then the scene
    std::string text;              ///< the report for a person
    std::string json;              ///< the report for a program
};

/// @param model  path of the model file.
/// @param out    path of the scene file to be; textures come to lie beside it.
Conversion convertFile(const std::string& model, ModelFiles& files, const std::string& out,
                       const Options& options);

/// Hands it from process to process, by way of a file.
bool send(const Conversion& conversion, std::FILE* stream);

/// The other end, which relies on nothing that the first one says.
/// @param out  path of the scene file; other files lie beside it, and their names begin with its name.
/// @return false if not all is there, or if it has files of other names.
bool receive(Conversion& conversion, const std::string& out, std::FILE* stream);

} // namespace convert
