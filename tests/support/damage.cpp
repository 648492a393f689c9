#include "support/damage.h"

#include <algorithm>
#include <random>

namespace support
{

namespace
{

constexpr size_t HEADER_SIZE = 64; // looked at byte by byte whatever the step

bool isChosen(size_t index, size_t step)
{
    return index < HEADER_SIZE || step <= 1 || index % step == 0;
}

} // namespace

void forEachCut(const Bytes& file, const std::function<void(const Bytes& cut, size_t length)>& use,
                size_t step)
{
    for (size_t length = 0; length < file.size(); ++length)
    {
        if (isChosen(length, step) || length + 1 == file.size())
            use(Bytes(file.begin(), file.begin() + ptrdiff_t(length)), length);
    }
}

void forEachSpoiledByte(const Bytes& file,
                        const std::function<void(const Bytes& spoiled, size_t offset)>& use, size_t step)
{
    for (size_t offset = 0; offset < file.size(); ++offset)
    {
        if (!isChosen(offset, step))
            continue;
        Bytes spoiled = file;
        for (uint8_t value : {uint8_t(0), uint8_t(0xff), uint8_t(file[offset] ^ (1u << offset % 8))})
        {
            spoiled[offset] = value;
            if (value != file[offset])
                use(spoiled, offset);
        }
    }
}

void forEachRandomDamage(const Bytes& file, int count,
                         const std::function<void(const Bytes& spoiled, int index)>& use, uint32_t seed)
{
    std::minstd_rand random(seed);
    for (int index = 0; index < count && !file.empty(); ++index)
    {
        Bytes spoiled = file;
        for (unsigned change = 0, changes = 1 + unsigned(random() % 8); change < changes; ++change)
            spoiled[random() % spoiled.size()] = uint8_t(random() >> 8);
        use(spoiled, index);
    }
}

} // namespace support
