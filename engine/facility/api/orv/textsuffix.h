#pragma once

#include "orv/export.h"

namespace orv
{

/// Whether text ends in suffix; an empty suffix always matches, a null pointer never does.
ORV_API bool endsWith(const char* text, const char* suffix);

/// The same with the letters a to z compared without regard to case.
ORV_API bool endsWithI(const char* text, const char* suffix);

} // namespace orv
