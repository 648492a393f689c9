#pragma once

#include <cstdint>
#include <cstdio>
#include <functional>
#include <string>

namespace convert
{

/// What work on a file from anywhere may use up.
struct Limits
{
    double seconds = 300.0;    ///< by the clock; 0 for no limit
    uint64_t mebibytes = 4096; ///< of address space; 0 for no limit
};

/// False in a build that checks addresses: it reserves more than any limit when it starts.
extern const bool CAN_LIMIT_MEMORY;

/// Runs work in a child process, so that no file can crash, stall or exhaust this one. What the child writes to
/// files is its own affair; if this process ends, so does the child.
/// @param work    is given the child's end of the handover, a file in memory; returns whether all is written there.
/// @param accept  is given the same file from its start, in this process, if work returned true; returns whether
///                it holds a result.
/// @param error   the limit that was hit, or what else the child died of.
/// @return false on an error.
bool runGuarded(const Limits& limits, const std::function<bool(std::FILE*)>& work,
                const std::function<bool(std::FILE*)>& accept, std::string& error);

} // namespace convert
