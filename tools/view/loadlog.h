#pragma once

#include <string>

/// The viewer's log function: passes errors and warnings, but not information, to standard error, and counts errors,
/// since a bad material does not fail a load.
namespace view::loadlog
{

void start();             ///< installs it
void reset();             ///< sets the count to 0
int getErrorCount();      ///< since reset()
std::string getMessage(); ///< the first of them; "" if there was none

} // namespace view::loadlog
