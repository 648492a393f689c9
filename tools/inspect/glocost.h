#pragma once

#include "gloscan.h"

namespace inspect
{

/// Whether the engine makes all that the file's references ask for; see orv::detail::glo::GloCredit.
bool isAffordable(const ScannedFile& file);

} // namespace inspect
