#pragma once

#include "findings.h"

#include <filesystem>
#include <string>
#include <utility>
#include <vector>

namespace inspect
{

/// What a material file or a shader program file says, statement by statement.
struct TextFile
{
    struct Statement
    {
        int line;
        std::vector<std::string> words; ///< the tag and its arguments
    };

    std::vector<Statement> statements;
};

/// @param folder  where what the file names is looked for, besides the engine's own assets.
TextFile checkAppearanceFile(const std::string& text, const std::filesystem::path& folder,
                             Findings& findings);
TextFile checkProgramFile(const std::string& text, const std::filesystem::path& folder, Findings& findings);

} // namespace inspect
