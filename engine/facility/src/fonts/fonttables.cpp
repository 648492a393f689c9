#include "fonttables.h"

#include <algorithm>
#include <climits>
#include <cmath>
#include <cstdint>

namespace orv::detail
{

namespace
{

const int MAX_POINTS = 16384;  ///< of one character, all parts together
const int MAX_COMPONENTS = 64; ///< likewise
const int MAX_DEPTH = 6;       ///< of composite glyphs within composite glyphs
const int GLYPH_HEADER_SIZE = 10;
const char* const DAMAGED_OUTLINE = "a glyph's outline is damaged";

constexpr uint32_t makeTag(const char (&text)[5])
{
    return uint32_t(text[0]) << 24 | uint32_t(text[1]) << 16 | uint32_t(text[2]) << 8 | uint32_t(text[3]);
}

/// A stretch of the file, big-endian. Reading outside of it gives 0 and makes it unsound for good.
class Bytes
{
public:
    Bytes() = default;
    Bytes(const unsigned char* start, std::size_t size) : m_start(start), m_size(size) {}

    unsigned u8(std::size_t at) { return has(at, 1) ? m_start[at] : 0u; }
    unsigned u16(std::size_t at) { return has(at, 2) ? unsigned(m_start[at] << 8 | m_start[at + 1]) : 0u; }
    int s16(std::size_t at) { return int16_t(u16(at)); }
    uint32_t u32(std::size_t at) { return uint32_t(u16(at)) << 16 | u16(at + 2); }

    /// An empty, unsound stretch where this one does not hold all of it.
    Bytes part(std::size_t at, std::size_t size)
    {
        Bytes bytes;
        if (has(at, size))
            bytes = Bytes(m_start + at, size);
        bytes.m_sound = m_sound;
        return bytes;
    }
    Bytes rest(std::size_t at) { return part(at, m_size - std::min(at, m_size)); }

    std::size_t size() const { return m_size; }
    bool isSound() const { return m_sound; }

private:
    bool has(std::size_t at, std::size_t count)
    {
        m_sound = m_sound && at <= m_size && count <= m_size - at;
        return m_sound;
    }

    const unsigned char* m_start = nullptr;
    std::size_t m_size = 0;
    bool m_sound = true;
};

/// The tables of one file, as the rasteriser finds and reads them.
class FontTables
{
public:
    FontTables(const unsigned char* file, std::size_t size) : m_file(file, size) {}

    const char* findTablesFault();
    const char* findCharacterFault(int c);

private:
    /// How far a glyph's points get from the origin along an axis, at most; and what it took to find out.
    struct Outline
    {
        float reach = 0.0f;
        const char* fault = nullptr;
    };

    bool findTable(uint32_t tag, Bytes& table);
    bool findCharacterMap();
    uint32_t findGlyph(unsigned c);
    uint32_t findGlyphInSegments(unsigned c);
    uint32_t findGlyphInGroups(unsigned c);
    bool hasMetrics(uint32_t glyph);
    Outline measureGlyph(uint32_t glyph, int depth);
    Outline measureContours(Bytes& glyph, unsigned contourCount);
    Outline measureComponents(Bytes& glyph, int depth);

    Bytes m_file;
    Bytes m_glyphs;    ///< glyf
    Bytes m_locations; ///< loca
    Bytes m_metrics;   ///< hmtx
    Bytes m_cmap;
    Bytes m_map; ///< the one of its subtables that is read
    unsigned m_mapFormat = 0;
    unsigned m_metricCount = 0;
    unsigned m_glyphCount = 0;
    bool m_hasWideLocations = false;
    int m_points = 0; ///< of the character being looked at
    int m_components = 0;
};

/// The first entry of the name counts. @return false if it is missing or reaches beyond the file.
bool FontTables::findTable(uint32_t tag, Bytes& table)
{
    const std::size_t DIRECTORY_SIZE = 12;
    const std::size_t ENTRY_SIZE = 16;
    const unsigned count = m_file.u16(4);
    m_file.part(DIRECTORY_SIZE,
                ENTRY_SIZE * count); // all of it: tables that need not be there are looked for too
    for (unsigned i = 0; i < count && m_file.isSound(); ++i)
    {
        const std::size_t entry = DIRECTORY_SIZE + ENTRY_SIZE * i;
        if (m_file.u32(entry) != tag)
            continue;
        const uint32_t offset = m_file.u32(entry + 8);
        table = m_file.part(offset, m_file.u32(entry + 12));
        return table.isSound() && offset != 0;
    }
    return false;
}

const char* FontTables::findTablesFault()
{
    const uint32_t version = m_file.u32(0);
    if (version == makeTag("OTTO"))
        return "its outlines are in PostScript form (CFF), not TrueType";
    if (version == makeTag("ttcf"))
        return "it is a collection of fonts";
    if (version != 0x00010000 && version != makeTag("true"))
        return "it is no TrueType font";

    Bytes head, hhea, maxp;
    if (!findTable(makeTag("head"), head) || !findTable(makeTag("hhea"), hhea) ||
        !findTable(makeTag("maxp"), maxp) || !findTable(makeTag("hmtx"), m_metrics) ||
        !findTable(makeTag("loca"), m_locations) || !findTable(makeTag("glyf"), m_glyphs) ||
        !findTable(makeTag("cmap"), m_cmap))
        return "a table is missing or reaches beyond the file";

    const unsigned locationFormat = head.u16(50);
    m_hasWideLocations = locationFormat == 1;
    m_glyphCount = maxp.u16(4);
    m_metricCount = hhea.u16(34);
    const int lineHeight = hhea.s16(4) - hhea.s16(6);
    if (!head.isSound() || !maxp.isSound() || !hhea.isSound() || locationFormat > 1)
        return "a header is damaged";
    if (lineHeight <= 0)
        return "its lines have no height";
    if (m_metricCount == 0)
        return "its characters have no widths";
    if (!findCharacterMap())
        return "it has no character map that can be read";
    return nullptr;
}

/// Takes the last map of a kind that the rasteriser knows: Unicode, by either of two platforms.
bool FontTables::findCharacterMap()
{
    const unsigned UNICODE = 0, MICROSOFT = 3, MICROSOFT_BMP = 1, MICROSOFT_FULL = 10;
    bool isFound = false;
    uint32_t offset = 0;
    const unsigned count = m_cmap.u16(2);
    for (unsigned i = 0; i < count && m_cmap.isSound(); ++i)
    {
        const std::size_t record = 4 + 8 * std::size_t(i);
        const unsigned platform = m_cmap.u16(record);
        const unsigned encoding = m_cmap.u16(record + 2);
        if (platform != UNICODE &&
            (platform != MICROSOFT || (encoding != MICROSOFT_BMP && encoding != MICROSOFT_FULL)))
            continue;
        offset = m_cmap.u32(record + 4);
        isFound = true;
    }
    if (!isFound || !m_cmap.isSound())
        return false;
    m_map = m_cmap.rest(offset);
    m_mapFormat = m_map.u16(0);
    const bool isKnown =
        m_mapFormat == 0 || m_mapFormat == 4 || m_mapFormat == 6 || m_mapFormat == 12 || m_mapFormat == 13;
    return isKnown && m_map.isSound();
}

/// @return 0, the glyph for what is missing, for a character that is not in the map.
uint32_t FontTables::findGlyph(unsigned c)
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

/// Format 4, by the very steps of the rasteriser: it believes what the file says about the search.
uint32_t FontTables::findGlyphInSegments(unsigned c)
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
uint32_t FontTables::findGlyphInGroups(unsigned c)
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

/// Behind the advance and bearing of the first glyphs stand bearings alone.
bool FontTables::hasMetrics(uint32_t glyph)
{
    m_metrics.u32(4 * std::size_t(std::min(glyph, m_metricCount - 1)));
    if (glyph >= m_metricCount)
        m_metrics.u16(4 * std::size_t(m_metricCount) + 2 * std::size_t(glyph - m_metricCount));
    return m_metrics.isSound();
}

const char* FontTables::findCharacterFault(int c)
{
    const uint32_t glyph = findGlyph(unsigned(c));
    if (!m_map.isSound())
        return "its character map is damaged";
    if (glyph >= m_glyphCount)
        return "its character map names a glyph that is not there";
    if (!hasMetrics(glyph))
        return "widths are missing";
    m_points = 0;
    m_components = 0;
    return measureGlyph(glyph, 0).fault;
}

FontTables::Outline FontTables::measureGlyph(uint32_t glyph, int depth)
{
    if (glyph >= m_glyphCount)
        return {0.0f, "a composite glyph names one that is not there"};
    const std::size_t start =
        m_hasWideLocations ? m_locations.u32(4 * std::size_t(glyph)) : 2 * m_locations.u16(2 * glyph);
    const std::size_t end = m_hasWideLocations ? m_locations.u32(4 * std::size_t(glyph) + 4)
                                               : 2 * m_locations.u16(2 * std::size_t(glyph) + 2);
    if (!m_locations.isSound() || start > end || end > m_glyphs.size())
        return {0.0f, "a glyph lies outside of its table"};
    if (start == end)
        return {};

    Bytes data = m_glyphs.part(start, end - start);
    const int contourCount = data.s16(0);
    const bool isBoxed = data.s16(2) <= data.s16(6) && data.s16(4) <= data.s16(8);
    if (!data.isSound() || !isBoxed)
        return {0.0f, "a glyph's box is damaged"};
    if (contourCount > 0)
        return measureContours(data, unsigned(contourCount));
    return contourCount < 0 ? measureComponents(data, depth) : Outline{};
}

/// A flag for each point, repeated ones only counted; all x, then all y, each relative to the one before, in
/// none, one or two bytes by the flag.
FontTables::Outline FontTables::measureContours(Bytes& glyph, unsigned contourCount)
{
    const unsigned ON_CURVE = 1, REPEAT = 8;
    struct Axis
    {
        unsigned isByte, isSame; ///< flags; where the first is set, the second is the byte's sign
        std::size_t at = 0;
        int value = 0;

        unsigned getSize(unsigned flag) const { return flag & isByte ? 1u : (flag & isSame ? 0u : 2u); }
        int read(Bytes& from, unsigned flag)
        {
            if (flag & isByte)
                value += flag & isSame ? int(from.u8(at)) : -int(from.u8(at));
            else if (!(flag & isSame))
                value += from.s16(at);
            at += getSize(flag);
            return std::abs(value);
        }
    };

    int lastStart = 0;
    int end = -1;
    for (unsigned i = 0; i < contourCount; ++i)
    {
        lastStart = end + 1;
        end = int(glyph.u16(GLYPH_HEADER_SIZE + 2 * std::size_t(i)));
        if (end < lastStart)
            return {0.0f, DAMAGED_OUTLINE};
    }
    const int pointCount = end + 1;
    m_points += pointCount;
    if (m_points > MAX_POINTS)
        return {0.0f, "a glyph has too many points"};

    const std::size_t instructions = GLYPH_HEADER_SIZE + 2 * std::size_t(contourCount);
    const std::size_t flagsStart = instructions + 2 + glyph.u16(instructions);
    const auto forEachFlag = [&glyph, flagsStart, pointCount](const auto& use)
    {
        std::size_t at = flagsStart;
        unsigned flag = 0;
        unsigned repeat = 0;
        for (int i = 0; i < pointCount; ++i)
        {
            if (repeat > 0)
                --repeat;
            else
            {
                flag = glyph.u8(at++);
                repeat = flag & REPEAT ? glyph.u8(at++) : 0;
            }
            use(flag);
        }
        return at;
    };

    Axis x = {2, 16};
    Axis y = {4, 32};
    unsigned lastFlag = 0;
    x.at = forEachFlag(
        [&](unsigned flag)
        {
            y.at += x.getSize(flag);
            lastFlag = flag;
        });
    y.at += x.at;
    // Looking for a point on the curve to start from, the rasteriser goes on to the next point, whatever is there.
    if (lastStart == end && !(lastFlag & ON_CURVE))
        return {0.0f, DAMAGED_OUTLINE};

    int reach = 0;
    forEachFlag([&](unsigned flag) { reach = std::max({reach, x.read(glyph, flag), y.read(glyph, flag)}); });
    if (!glyph.isSound() || reach > INT16_MAX)
        return {0.0f, DAMAGED_OUTLINE};
    return {float(reach), nullptr};
}

FontTables::Outline FontTables::measureComponents(Bytes& glyph, int depth)
{
    const unsigned WORDS = 1, OFFSETS = 2, SCALE = 8, MORE = 32, TWO_SCALES = 64, MATRIX = 128;
    if (depth >= MAX_DEPTH)
        return {0.0f, "composite glyphs are nested too deeply"};

    float reach = 0.0f;
    std::size_t at = GLYPH_HEADER_SIZE;
    unsigned flags = MORE;
    while (flags & MORE)
    {
        if (++m_components > MAX_COMPONENTS)
            return {0.0f, "a glyph has too many parts"};
        flags = glyph.u16(at);
        const uint32_t part = glyph.u16(at + 2);
        if (glyph.isSound() && !(flags & OFFSETS))
            return {0.0f, "a glyph's parts are placed by matching points"};
        const int dx = flags & WORDS ? glyph.s16(at + 4) : int8_t(glyph.u8(at + 4));
        const int dy = flags & WORDS ? glyph.s16(at + 6) : int8_t(glyph.u8(at + 5));
        at += flags & WORDS ? 8 : 6;

        float matrix[4] = {1.0f, 0.0f, 0.0f, 1.0f};
        const auto readFixed = [&glyph, &at] { return float(glyph.s16((at += 2) - 2)) / 16384.0f; };
        if (flags & SCALE)
            matrix[0] = matrix[3] = readFixed();
        else if (flags & TWO_SCALES)
        {
            matrix[0] = readFixed();
            matrix[3] = readFixed();
        }
        else if (flags & MATRIX)
        {
            for (float& element : matrix)
                element = readFixed();
        }
        if (!glyph.isSound())
            return {0.0f, "a composite glyph is damaged"};

        const Outline outline = measureGlyph(part, depth + 1);
        if (outline.fault)
            return outline;
        // As the rasteriser has it, the axes' own scales once more on top of the matrix.
        const auto bound = [&outline](float a, float b, float axisScale, int offset)
        { return axisScale * ((std::abs(a) + std::abs(b)) * outline.reach + float(std::abs(offset))); };
        reach = std::max({reach, bound(matrix[0], matrix[2], std::hypot(matrix[0], matrix[1]), dx),
                          bound(matrix[1], matrix[3], std::hypot(matrix[2], matrix[3]), dy)});
        if (reach > float(INT16_MAX))
            return {0.0f, "a glyph's parts are too far away"};
    }
    return {reach, nullptr};
}

} // namespace

const char* findFontFault(const unsigned char* file, std::size_t size, int firstChar, int charCount)
{
    if (!file || size > INT_MAX)
        return "it cannot be read into memory";
    FontTables tables(file, size);
    const char* fault = tables.findTablesFault();
    for (int i = 0; i < charCount && !fault; ++i)
        fault = tables.findCharacterFault(firstChar + i);
    return fault;
}

} // namespace orv::detail
