#pragma once

#include <string>
#include <vector>

namespace pssandroid
{

struct ZipEntry
{
    std::string name;
    std::string content;
};

/// A zip archive of uncompressed entries, as an application package holds its assets.
std::string makeStoredZip(const std::vector<ZipEntry>& entries);

} // namespace pssandroid
