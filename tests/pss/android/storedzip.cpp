#include "storedzip.h"

#include <cstdint>

namespace pssandroid
{

namespace
{

/// The low size bytes of value, little-endian.
std::string number(uint64_t value, int size)
{
    std::string bytes;
    for (int i = 0; i < size; ++i)
        bytes += char(value >> (8 * i) & 0xff);
    return bytes;
}

uint32_t checksum(const std::string& content)
{
    uint32_t crc = 0xffffffffu;
    for (unsigned char byte : content)
    {
        crc ^= byte;
        for (int bit = 0; bit < 8; ++bit)
            crc = crc >> 1 ^ (crc & 1 ? 0xedb88320u : 0);
    }
    return ~crc;
}

/// The fields that the local header and the directory entry have in common: from the version needed to extract
/// to the length of the extra field.
std::string commonFields(const ZipEntry& entry)
{
    const uint32_t size = uint32_t(entry.content.size());
    const uint32_t date = 1 << 5 | 1; // the first of January 1980
    return number(10, 2) + number(0, 6) + number(date, 2) + number(checksum(entry.content), 4) +
           number(size, 4) + number(size, 4) + number(uint32_t(entry.name.size()), 2) + number(0, 2);
}

} // namespace

std::string makeStoredZip(const std::vector<ZipEntry>& entries)
{
    std::string archive;
    std::string directory;
    for (const ZipEntry& entry : entries)
    {
        const uint32_t offset = uint32_t(archive.size());
        archive += "PK\3\4" + commonFields(entry) + entry.name + entry.content;
        directory += "PK\1\2" + number(10, 2) + commonFields(entry) + number(0, 6) + number(0, 4) +
                     number(offset, 4) + entry.name;
    }
    const uint32_t count = uint32_t(entries.size());
    const uint32_t start = uint32_t(archive.size());
    return archive + directory + "PK\5\6" + number(0, 4) + number(count, 2) + number(count, 2) +
           number(uint32_t(directory.size()), 4) + number(start, 4) + number(0, 2);
}

} // namespace pssandroid
