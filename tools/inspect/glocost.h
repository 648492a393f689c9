#pragma once

#include "gloscan.h"

namespace inspect
{

/// Whether the engine accepts the number of objects made by reference; see orv::detail::glo::GloCredit.
bool isAffordable(const ScannedFile& file);

} // namespace inspect
