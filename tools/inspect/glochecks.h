#pragma once

#include "gloscan.h"

#include <filesystem>

namespace inspect
{

/// What only shows when the records are held against each other: references, bounds, values that will not be seen
/// as they were meant.
/// @param folder  where the pictures lie.
void checkGlo(const ScannedFile& file, const std::filesystem::path& folder, Findings& findings);

} // namespace inspect
