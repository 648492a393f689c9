#include "orv/detail/fonttables.h"

#include <climits>

namespace orv::detail
{

namespace
{

/// With the character map, as the rasteriser finds and reads it.
class CharacterTables : public FontTables
{
public:
    CharacterTables(const unsigned char* file, std::size_t size) : FontTables(file, size) {}

    bool findCharacterMap();
    const char* findCharacterFault(int c);

private:
    uint32_t findGlyph(unsigned c);
    uint32_t findGlyphInSegments(unsigned c);
    uint32_t findGlyphInGroups(unsigned c);

    FontBytes m_map; ///< the subtable that is read
    unsigned m_mapFormat = 0;
};

/// Uses the last map of a kind that the rasteriser knows: Unicode, of either of two platforms.
bool CharacterTables::findCharacterMap()
{
    const unsigned UNICODE = 0, MICROSOFT = 3, MICROSOFT_BMP = 1, MICROSOFT_FULL = 10;
    bool isFound = false;
    uint32_t offset = 0;
    FontBytes maps = getCharacterMaps();
    const unsigned count = maps.u16(2);
    for (unsigned i = 0; i < count && maps.isSound(); ++i)
    {
        const std::size_t record = 4 + 8 * std::size_t(i);
        const unsigned platform = maps.u16(record);
        const unsigned encoding = maps.u16(record + 2);
        if (platform != UNICODE &&
            (platform != MICROSOFT || (encoding != MICROSOFT_BMP && encoding != MICROSOFT_FULL)))
            continue;
        offset = maps.u32(record + 4);
        isFound = true;
    }
    if (!isFound || !maps.isSound())
        return false;
    m_map = maps.rest(offset);
    m_mapFormat = m_map.u16(0);
    const bool isKnown =
        m_mapFormat == 0 || m_mapFormat == 4 || m_mapFormat == 6 || m_mapFormat == 12 || m_mapFormat == 13;
    return isKnown && m_map.isSound();
}

/// @return 0, the glyph for what is missing, for a character that is not in the map.
uint32_t CharacterTables::findGlyph(unsigned c)
{
    switch (m_mapFormat)
    {
    case 0: return c + 6 < m_map.u16(2) ? m_map.u8(6 + c) : 0;
    case 4: return findGlyphInSegments(c);
    case 6:
    {
        const unsigned index = c - m_map.u16(6);
        return index < m_map.u16(8) ? m_map.u16(10 + 2 * std::size_t(index)) : 0;
    }
    default: return findGlyphInGroups(c);
    }
}

/// Format 4, with exactly the rasteriser's steps: it trusts the file's search parameters.
uint32_t CharacterTables::findGlyphInSegments(unsigned c)
{
    const std::size_t ENDS = 14;
    const std::size_t segmentCount = m_map.u16(6) >> 1;
    unsigned range = m_map.u16(8) >> 1;
    const unsigned steps = m_map.u16(10);
    const std::size_t shift = (m_map.u16(12) >> 1) * std::size_t(2);

    std::size_t search = ENDS;
    if (c >= m_map.u16(search + shift))
        search += shift;
    search -= 2;
    for (unsigned i = 0; i < steps; ++i)
    {
        range >>= 1;
        if (c > m_map.u16(search + range * std::size_t(2)))
            search += range * std::size_t(2);
    }
    search += 2;

    const std::size_t item = 2 * std::size_t(uint16_t((search - ENDS) >> 1));
    const std::size_t starts = ENDS + 2 * segmentCount + 2;
    const unsigned start = m_map.u16(starts + item);
    const unsigned last = m_map.u16(ENDS + item);
    if (c < start || c > last)
        return 0;
    const std::size_t offsetAt = starts + 4 * segmentCount + item;
    const unsigned offset = m_map.u16(offsetAt);
    if (offset == 0)
        return uint16_t(c + m_map.u16(starts + 2 * segmentCount + item));
    return m_map.u16(offsetAt + offset + 2 * std::size_t(c - start));
}

/// Formats 12 and 13.
uint32_t CharacterTables::findGlyphInGroups(unsigned c)
{
    const std::size_t GROUPS = 16;
    const std::size_t GROUP_SIZE = 12;
    uint32_t low = 0;
    uint32_t high = m_map.u32(12);
    while (low < high && m_map.isSound())
    {
        const uint32_t middle = low + (high - low) / 2;
        const std::size_t group = GROUPS + GROUP_SIZE * middle;
        const uint32_t first = m_map.u32(group);
        if (c < first)
            high = middle;
        else if (c > m_map.u32(group + 4))
            low = middle + 1;
        else
            return m_map.u32(group + 8) + (m_mapFormat == 12 ? c - first : 0);
    }
    return 0;
}

const char* CharacterTables::findCharacterFault(int c)
{
    const uint32_t glyph = findGlyph(unsigned(c));
    if (!m_map.isSound())
        return "its character map is damaged";
    if (glyph >= getGlyphCount())
        return "its character map refers to a missing glyph";
    return findGlyphFault(glyph);
}

} // namespace

const char* findFontFault(const unsigned char* file, std::size_t size, int firstChar, int charCount)
{
    if (!file || size > INT_MAX)
        return "it cannot be read into memory";
    CharacterTables tables(file, size);
    const char* fault = tables.findTablesFault();
    if (!fault && !tables.findCharacterMap())
        fault = "it has no character map that can be read";
    for (int i = 0; i < charCount && !fault; ++i)
        fault = tables.findCharacterFault(firstChar + i);
    return fault;
}

} // namespace orv::detail
