#pragma once

#include <string>

namespace convert
{

/// False in a build that checks addresses, whose checks need more than a confined process has.
extern const bool CAN_CONFINE;

/// Takes every right from this process that converting does without, for good: from now on it opens no files and no
/// connections, starts no programs and signals no other process. It reads and writes what is open, and has memory.
/// Whatever else it tries fails (EACCES).
/// @param socket  the one over which it may still exchange messages.
/// @param error   why the system does not do that.
bool confine(int socket, std::string& error);

} // namespace convert
