#pragma once

#include "gloscan.h"

#include <filesystem>

namespace inspect
{

/// Checks that compare records with each other: references, bounds, values that will look wrong.
/// @param folder  where the pictures lie.
void checkGlo(const ScannedFile& file, const std::filesystem::path& folder, Findings& findings);

} // namespace inspect
