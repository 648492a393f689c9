#pragma once

#include <cstdint>
#include <cstdio>
#include <functional>
#include <string>

namespace convert
{

class FileGate;
class ModelFiles;

/// What work on a file from anywhere may use up.
struct Limits
{
    double seconds = 300.0;    ///< by the clock; 0 for no limit
    uint64_t mebibytes = 4096; ///< of address space; 0 for no limit
};

/// False in a build that checks addresses: it reserves more than any limit when it starts.
extern const bool CAN_LIMIT_MEMORY;

/// Given the child's end of the handover, a file in memory, and the way to the model's files.
/// @return whether all is written to the handover.
using Work = std::function<bool(std::FILE* handover, ModelFiles& files)>;

/// Runs work in a child process, so that no file can crash, stall or exhaust this one. The child has nothing of this
/// process but the standard streams, the handover and the files that the gate opens for it; where the system can do
/// that, it is confined to them (see confine), and else standard error has a line of it, once. If this process ends, so
/// does the child.
/// @param model   the file that the user named.
/// @param gate    answers the child while this process waits.
/// @param accept  is given the handover from its start, in this process, if work returned true; returns whether it
///                holds a result.
/// @param error   the limit that was hit, or what else the child died of.
/// @return false on an error.
bool runGuarded(const Limits& limits, const std::string& model, FileGate& gate, const Work& work,
                const std::function<bool(std::FILE*)>& accept, std::string& error);

} // namespace convert
