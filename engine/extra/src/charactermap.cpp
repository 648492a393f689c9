#include "charactermap.h"

namespace orv::detail
{

namespace
{

bool isUnicode(unsigned platform, unsigned encoding)
{
    const unsigned UNICODE = 0, MICROSOFT = 3, MICROSOFT_BMP = 1, MICROSOFT_FULL = 10;
    return platform == UNICODE ||
           (platform == MICROSOFT && (encoding == MICROSOFT_BMP || encoding == MICROSOFT_FULL));
}

/// Higher for formats that can hold more characters. @return 0 for unsupported formats.
int rateFormat(unsigned format)
{
    switch (format)
    {
    case 12: return 5;
    case 10: return 4;
    case 4: return 3;
    case 13: return 2; // one glyph for whole scripts: the last choice
    case 0:
    case 6: return 1;
    default: return 0;
    }
}

/// Format 4: segments of characters, sorted by their ends.
uint32_t findInSegments(FontBytes& map, uint32_t c)
{
    const std::size_t ENDS = 14;
    const std::size_t count = map.u16(6) / 2;
    std::size_t low = 0;
    std::size_t high = count;
    while (low < high)
    {
        const std::size_t middle = (low + high) / 2;
        if (map.u16(ENDS + 2 * middle) < c)
            low = middle + 1;
        else
            high = middle;
    }
    if (low == count)
        return 0;

    const std::size_t starts = ENDS + 2 * count + 2;
    const std::size_t deltas = starts + 2 * count;
    const std::size_t offsetAt = deltas + 2 * count + 2 * low;
    const unsigned start = map.u16(starts + 2 * low);
    const unsigned delta = map.u16(deltas + 2 * low);
    const unsigned offset = map.u16(offsetAt);
    if (c < start || offset == 0xFFFF)
        return 0;
    if (offset == 0)
        return uint16_t(c + delta);
    const unsigned glyph = map.u16(offsetAt + offset + 2 * std::size_t(c - start));
    return glyph == 0 ? 0 : uint16_t(glyph + delta);
}

/// Formats 12 and 13: sorted groups of first, last and glyph.
uint32_t findInGroups(FontBytes& map, uint32_t c, bool isCounting)
{
    const std::size_t GROUPS = 16;
    const std::size_t GROUP_SIZE = 12;
    std::size_t low = 0;
    std::size_t high = map.u32(12);
    while (low < high && map.isSound())
    {
        const std::size_t middle = low + (high - low) / 2;
        const std::size_t group = GROUPS + GROUP_SIZE * middle;
        const uint32_t first = map.u32(group);
        if (c < first)
            high = middle;
        else if (c > map.u32(group + 4))
            low = middle + 1;
        else
            return map.u32(group + 8) + (isCounting ? c - first : 0);
    }
    return 0;
}

} // namespace

bool CharacterMap::read(FontBytes maps)
{
    int best = 0;
    const unsigned count = maps.u16(2);
    for (unsigned i = 0; i < count && maps.isSound(); ++i)
    {
        const std::size_t record = 4 + 8 * std::size_t(i);
        if (!isUnicode(maps.u16(record), maps.u16(record + 2)))
            continue;
        FontBytes whole = maps;
        FontBytes map = whole.rest(maps.u32(record + 4));
        const unsigned format = map.u16(0);
        if (!map.isSound() || rateFormat(format) <= best)
            continue;
        best = rateFormat(format);
        m_map = map;
        m_format = format;
    }
    return best > 0;
}

uint32_t CharacterMap::find(uint32_t c) const
{
    FontBytes map = m_map;
    uint32_t glyph = 0;
    switch (m_format)
    {
    case 0: glyph = c < 256 ? map.u8(6 + c) : 0; break;
    case 4: glyph = c <= 0xFFFF ? findInSegments(map, c) : 0; break;
    case 6:
        if (c >= map.u16(6) && c - map.u16(6) < map.u16(8))
            glyph = map.u16(10 + 2 * std::size_t(c - map.u16(6)));
        break;
    case 10:
        if (c >= map.u32(12) && c - map.u32(12) < map.u32(16))
            glyph = map.u16(20 + 2 * std::size_t(c - map.u32(12)));
        break;
    default: glyph = findInGroups(map, c, m_format == 12);
    }
    return map.isSound() ? glyph : 0;
}

} // namespace orv::detail
