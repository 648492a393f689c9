#pragma once

#include <string>

/// The engine's log, as a viewer wants it: errors and warnings go on to standard error, what is merely of interest
/// does not, and errors are counted, since a material that cannot be read fails no load.
namespace view::loadlog
{

void start();             ///< sends the engine's log through here
void reset();             ///< none counted
int getErrorCount();      ///< since reset()
std::string getMessage(); ///< the first of them; "" if there was none

} // namespace view::loadlog
