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

/// Writes all files or none: first to temporary names in their folders; when all bytes are written, they are renamed in
/// the list's order. Signals that interrupt the program are blocked meanwhile.
/// @param inputs  files opened there are not overwritten, under any name.
/// @param error   "path: reason".
bool writeFiles(const std::vector<OutputFile>& files, const FileGate& inputs, std::string& error);

} // namespace convert
