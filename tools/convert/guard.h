#pragma once

#include <cstdint>
#include <cstdio>
#include <functional>
#include <string>

namespace convert
{

class FileGate;
class ModelFiles;

/// Limits for work on an untrusted file.
struct Limits
{
    double seconds = 300.0;    ///< by the clock; 0 for no limit
    uint64_t mebibytes = 4096; ///< of address space; 0 for no limit
};

/// False in a build with address checks, which reserve more than any limit at the start.
extern const bool CAN_LIMIT_MEMORY;

/// Receives the handover, a file in memory, and access to the model's files.
/// @return whether the handover is complete.
using Work = std::function<bool(std::FILE* handover, ModelFiles& files)>;

/// Runs work in a child process, so that no file can crash, stall or exhaust this one. The child has only the standard
/// streams, the handover and the files that the gate opens for it. If the system can, it confines the child to them
/// (see confine); otherwise standard error says so, once. The child ends when this process ends.
/// @param model   the file that the user named.
/// @param gate    answers the child while this process waits.
/// @param accept  called in this process with the handover, from its start, if work returned true; returns whether it
///                holds a result.
/// @param error   the exceeded limit, or how the child died.
/// @return false on an error.
bool runGuarded(const Limits& limits, const std::string& model, FileGate& gate, const Work& work,
                const std::function<bool(std::FILE*)>& accept, std::string& error);

} // namespace convert
