#pragma once

#include <cstdint>
#include <string>
#include <vector>

namespace convert
{

class FileGate;

struct OutputFile
{
    std::string path;
    std::vector<uint8_t> bytes;
};

/// Writes files, all of them or none: to temporary names in their folders first, and when all bytes are there under
/// their own names, the last file of the list last. What interrupts a program waits meanwhile.
/// @param inputs  a file that was opened there is not written over, by whatever name.
/// @param error   "path: reason".
bool writeFiles(const std::vector<OutputFile>& files, const FileGate& inputs, std::string& error);

} // namespace convert
