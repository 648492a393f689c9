#pragma once

#include <string>

/// The engine's log, as a viewer wants it: errors and warnings go on to standard error, what is merely of interest
/// does not, and errors are counted, since a material that cannot be read fails no load.
///
/// For programs that are linked with the engine's objects and LINKER:--wrap for each of the four entry points.
namespace view::loadlog
{

void reset();             ///< none counted
int getErrorCount();      ///< since reset()
std::string getMessage(); ///< the first of them; "" if there was none

} // namespace view::loadlog
