#pragma once

#include "findings.h"

#include <filesystem>
#include <string>
#include <utility>
#include <vector>

namespace inspect
{

/// The statements of a material or shader program file.
struct TextFile
{
    struct Statement
    {
        int line;
        std::vector<std::string> words; ///< the tag and its arguments
    };

    std::vector<Statement> statements;
};

/// @param folder  searched for files that it names, besides the engine's own assets.
TextFile checkAppearanceFile(const std::string& text, const std::filesystem::path& folder,
                             Findings& findings);
TextFile checkProgramFile(const std::string& text, const std::filesystem::path& folder, Findings& findings);

} // namespace inspect
