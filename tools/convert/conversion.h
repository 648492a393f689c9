#pragma once

#include "options.h"
#include "outputfiles.h"

#include <cstdio>
#include <string>
#include <vector>

namespace convert
{

class ModelFiles;

/// The result of converting a model; nothing is written yet.
struct Conversion
{
    std::string error;             ///< why it failed; empty on success
    std::vector<OutputFile> files; ///< textures, then the scene
    std::string text;              ///< the report for a person
    std::string json;              ///< the report for a program
};

/// @param model  path of the model file.
/// @param out    path of the scene file; textures go beside it.
Conversion convertFile(const std::string& model, ModelFiles& files, const std::string& out,
                       const Options& options);

/// Passes it between processes through a file.
bool send(const Conversion& conversion, std::FILE* stream);

/// The receiving end; does not trust the sender.
/// @param out  path of the scene file; other files lie beside it, and their names begin with its name.
/// @return false if not all is there, or if it has files of other names.
bool receive(Conversion& conversion, const std::string& out, std::FILE* stream);

} // namespace convert
