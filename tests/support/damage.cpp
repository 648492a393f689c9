#include "support/damage.h"

#include <algorithm>
#include <random>

namespace support
{

namespace
{

using Use = std::function<void(const Bytes& damaged)>;

Bytes part(const Bytes& file, size_t begin, size_t end)
{
    return Bytes(file.begin() + ptrdiff_t(begin), file.begin() + ptrdiff_t(std::min(end, file.size())));
}

void append(Bytes& file, const Bytes& more, int count = 1)
{
    for (int i = 0; i < count; ++i)
        file.insert(file.end(), more.begin(), more.end());
}

void spoilByte(const Bytes& file, size_t at, const Use& use)
{
    Bytes damaged = file;
    for (const uint8_t value : {uint8_t(0), uint8_t(255), uint8_t(file[at] ^ (1u << at % 8))})
    {
        damaged[at] = value;
        if (value != file[at])
            use(damaged);
    }
}

/// In either order of bytes.
void spoilNumber(const Bytes& file, size_t at, const Use& use)
{
    if (at + 4 > file.size())
        return;
    Bytes damaged = file;
    for (const uint32_t value :
         {0xffffffffu, 0xfffffff8u, 0x80000000u, 0x7fffffffu, 0x10000u, uint32_t(file.size() + 1)})
    {
        for (const bool isBig : {false, true})
        {
            for (size_t i = 0; i < 4; ++i)
                damaged[at + i] = uint8_t(value >> 8 * (isBig ? 3 - i : i));
            use(damaged);
        }
    }
}

void splice(const Bytes& file, size_t at, const Use& use)
{
    constexpr size_t SIZES[] = {1, 4, 16, 77, 256};
    const size_t size = SIZES[at % std::size(SIZES)];
    const Bytes block = part(file, at, at + size);
    const size_t elsewhere = (at * 7 + 3) % file.size();
    for (const int count : {0, 2, 50})
    {
        Bytes damaged = part(file, 0, at);
        append(damaged, block, count);
        append(damaged, part(file, at + block.size(), file.size()));
        use(damaged);
    }
    Bytes moved = part(file, 0, elsewhere);
    append(moved, block);
    append(moved, part(file, elsewhere, file.size()));
    use(moved);
}

void randomise(const Bytes& file, size_t at, const Use& use)
{
    std::minstd_rand random(unsigned(at) + 1);
    Bytes damaged = file;
    for (unsigned change = 0, changes = 1 + unsigned(random() % 8); change < changes; ++change)
        damaged[random() % damaged.size()] = uint8_t(random() >> 8);
    use(damaged);
}

struct Maker
{
    const char* name;
    void (*make)(const Bytes& file, size_t at, const Use& use);
};

constexpr Maker MAKERS[] = {
    {"byte", spoilByte}, {"number", spoilNumber}, {"splice", splice}, {"random", randomise}};

} // namespace

void forEachDamage(const Bytes& file, size_t step,
                   const std::function<void(const Bytes& damaged, const std::string& what)>& use)
{
    for (size_t length = 0; length < file.size(); ++length)
        use(part(file, 0, length), "cut to " + std::to_string(length));
    for (const Maker& maker : MAKERS)
    {
        for (size_t at = 0; at < file.size(); at += step)
        {
            const std::string what = maker.name + (" at " + std::to_string(at));
            maker.make(file, at, [&](const Bytes& damaged) { use(damaged, what); });
        }
    }
}

} // namespace support
