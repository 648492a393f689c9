#pragma once

#include <string>

namespace convert
{

/// False in a build with address checks, which need more than a confined process may do.
extern const bool CAN_CONFINE;

/// Confines this process for good: it can no longer open files or connections, start programs or signal other
/// processes. It can read and write open files and allocate memory. All other calls fail (EACCES).
/// @param socket  the one over which it may still exchange messages.
/// @param error   why the system refuses.
bool confine(int socket, std::string& error);

} // namespace convert
