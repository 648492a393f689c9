#pragma once

#include <algorithm>
#include <cmath>
#include <cstddef>
#include <cstdint>
#include <cstdlib>

namespace orv::detail
{

/// Whether a TrueType file keeps the promises that the rasteriser relies on without asking, as far as some
/// characters are concerned: everything that it reads for them lies within the table it belongs to, and see
/// FontTables::findGlyphFault().
///
/// @param firstChar,charCount  Unicode code points, at most 65535 of them.
/// @return null, or what is wrong, for a log.
const char* findFontFault(const unsigned char* file, std::size_t size, int firstChar, int charCount);

constexpr uint32_t makeFontTag(const char (&text)[5])
{
    return uint32_t(text[0]) << 24 | uint32_t(text[1]) << 16 | uint32_t(text[2]) << 8 | uint32_t(text[3]);
}

/// A stretch of the file, big-endian. Reading outside of it gives 0 and makes it unsound for good.
class FontBytes
{
public:
    FontBytes() = default;
    FontBytes(const unsigned char* start, std::size_t size) : m_start(start), m_size(size) {}

    unsigned u8(std::size_t at) { return has(at, 1) ? m_start[at] : 0u; }
    unsigned u16(std::size_t at) { return has(at, 2) ? unsigned(m_start[at] << 8 | m_start[at + 1]) : 0u; }
    int s16(std::size_t at) { return int16_t(u16(at)); }
    uint32_t u32(std::size_t at) { return uint32_t(u16(at)) << 16 | u16(at + 2); }

    /// An empty, unsound stretch where this one does not hold all of it.
    FontBytes part(std::size_t at, std::size_t size)
    {
        FontBytes bytes;
        if (has(at, size))
            bytes = FontBytes(m_start + at, size);
        bytes.m_sound = m_sound;
        return bytes;
    }
    FontBytes rest(std::size_t at) { return part(at, m_size - std::min(at, m_size)); }

    const unsigned char* start() const { return m_start; }
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

/// One coordinate of a glyph's points, each relative to the one before, in none, one or two bytes by the point's flag.
struct FontAxis
{
    unsigned isByte, isSame; ///< flags; where the first is set, the second is the byte's sign
    std::size_t at = 0;
    int value = 0;

    unsigned getSize(unsigned flag) const { return flag & isByte ? 1u : (flag & isSame ? 0u : 2u); }

    /// @return its distance from 0.
    int read(FontBytes& from, unsigned flag)
    {
        if (flag & isByte)
            value += flag & isSame ? int(from.u8(at)) : -int(from.u8(at));
        else if (!(flag & isSame))
            value += from.s16(at);
        at += getSize(flag);
        return std::abs(value);
    }
};

/// Calls use(flag) for each point. A repeated flag stands in the file once, with its count.
/// @return where the flags end.
template <class Use>
std::size_t forEachFlag(FontBytes& glyph, std::size_t at, int pointCount, const Use& use)
{
    const unsigned REPEAT = 8;
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
}

/// The tables of one font, as the rasteriser finds and reads them, which believes whatever the file says.
///
/// Nothing is copied, and nothing outside of the file is read. Once something would have been, everything is faulty from then
/// on; who goes on asking keeps a copy from before.
class FontTables
{
public:
    static constexpr const char* MISSING_TABLE = "a table is missing or reaches beyond the file";

    /// @param start  of its directory of tables: 0, but for a font of a collection.
    FontTables(const unsigned char* file, std::size_t size, std::size_t start = 0)
        : m_file(file, size)
        , m_start(start)
    {
    }

    /// Of what is read for any glyph; to be asked before everything else. The character map is only found.
    /// @return null, or what is wrong, for a log.
    const char* findTablesFault();

    /// The same for a font of a known kind; unless it is TrueType, without the tables of its outlines.
    template <bool IS_TRUE_TYPE>
    const char* findHeadersFault();

    /// @return false if a glyph's width and bearing are not within their table.
    bool hasMetrics(uint32_t glyph);

    /// Whether the rasteriser may draw a glyph: metrics and outline lie within their tables, composite glyphs end, no
    /// coordinate leaves 16 bits, and there are at most 16384 points.
    /// @return null, or what is wrong, for a log.
    const char* findGlyphFault(uint32_t glyph);

    /// The first entry of the name counts. @return false if it is missing or reaches beyond the file.
    bool findTable(uint32_t tag, FontBytes& table);

    /// Whether the outlines are in PostScript form (CFF), by the font's first bytes.
    bool isPostScript() const
    {
        FontBytes file = m_file;
        return file.u32(m_start) == makeFontTag("OTTO");
    }
    const FontBytes& getCharacterMaps() const { return m_cmap; }
    unsigned getGlyphCount() const { return m_glyphCount; }

    /// How far the pen moves, in the font's units. @return 0 for a glyph that has no metrics.
    int getAdvance(uint32_t glyph) const
    {
        FontBytes metrics = m_metrics;
        return metrics.s16(4 * std::size_t(std::min(glyph, m_metricCount - 1)));
    }

private:
    /// How far a glyph's points get from the origin along an axis, at most; and what it took to find out.
    struct Outline
    {
        float reach = 0.0f;
        const char* fault = nullptr;
    };

    Outline measureGlyph(uint32_t glyph, int depth);
    Outline measureContours(FontBytes& glyph, unsigned contourCount);
    Outline measurePoints(FontBytes& glyph, std::size_t flagsStart, int pointCount, bool endsInOnePoint);
    Outline measureComponents(FontBytes& glyph, int depth);

    static constexpr int MAX_POINTS = 16384;  ///< of one character, all parts together
    static constexpr int MAX_COMPONENTS = 64; ///< likewise
    static constexpr int MAX_DEPTH = 6;       ///< of composite glyphs within composite glyphs
    static constexpr int GLYPH_HEADER_SIZE = 10;
    static constexpr const char* DAMAGED_OUTLINE = "a glyph's outline is damaged";

    FontBytes m_file;
    std::size_t m_start;
    FontBytes m_glyphs;    ///< glyf
    FontBytes m_locations; ///< loca
    FontBytes m_metrics;   ///< hmtx
    FontBytes m_cmap;
    unsigned m_metricCount = 0;
    unsigned m_glyphCount = 0;
    bool m_hasWideLocations = false;
    int m_points = 0; ///< of the character being looked at
    int m_components = 0;
};

inline bool FontTables::findTable(uint32_t tag, FontBytes& table)
{
    const std::size_t DIRECTORY_SIZE = 12;
    const std::size_t ENTRY_SIZE = 16;
    const unsigned count = m_file.u16(m_start + 4);
    m_file.part(m_start + DIRECTORY_SIZE,
                ENTRY_SIZE * count); // all of it: tables that need not be there are looked for too
    for (unsigned i = 0; i < count && m_file.isSound(); ++i)
    {
        const std::size_t entry = m_start + DIRECTORY_SIZE + ENTRY_SIZE * i;
        if (m_file.u32(entry) != tag)
            continue;
        const uint32_t offset = m_file.u32(entry + 8);
        table = m_file.part(offset, m_file.u32(entry + 12));
        return table.isSound() && offset != 0;
    }
    return false;
}

inline const char* FontTables::findTablesFault()
{
    const uint32_t version = m_file.u32(m_start);
    if (version == makeFontTag("OTTO"))
        return "its outlines are in PostScript form (CFF), not TrueType";
    if (version == makeFontTag("ttcf"))
        return "it is a collection of fonts";
    if (version != 0x00010000 && version != makeFontTag("true"))
        return "it is no TrueType font";

    return findHeadersFault<true>();
}

template <bool IS_TRUE_TYPE>
const char* FontTables::findHeadersFault()
{
    FontBytes head, hhea, maxp;
    if (!findTable(makeFontTag("head"), head) || !findTable(makeFontTag("hhea"), hhea) ||
        !findTable(makeFontTag("maxp"), maxp) || !findTable(makeFontTag("hmtx"), m_metrics) ||
        (IS_TRUE_TYPE &&
         (!findTable(makeFontTag("loca"), m_locations) || !findTable(makeFontTag("glyf"), m_glyphs))) ||
        !findTable(makeFontTag("cmap"), m_cmap))
        return MISSING_TABLE;

    const unsigned locationFormat = head.u16(50);
    m_hasWideLocations = locationFormat == 1;
    m_glyphCount = maxp.u16(4);
    m_metricCount = hhea.u16(34);
    const int lineHeight = hhea.s16(4) - hhea.s16(6);
    if (!head.isSound() || !maxp.isSound() || !hhea.isSound() || (IS_TRUE_TYPE && locationFormat > 1))
        return "a header is damaged";
    if (lineHeight <= 0)
        return "its lines have no height";
    if (m_metricCount == 0)
        return "its characters have no widths";
    return nullptr;
}

/// Behind the advance and bearing of the first glyphs stand bearings alone.
inline bool FontTables::hasMetrics(uint32_t glyph)
{
    m_metrics.u32(4 * std::size_t(std::min(glyph, m_metricCount - 1)));
    if (glyph >= m_metricCount)
        m_metrics.u16(4 * std::size_t(m_metricCount) + 2 * std::size_t(glyph - m_metricCount));
    return m_metrics.isSound();
}

inline const char* FontTables::findGlyphFault(uint32_t glyph)
{
    if (!hasMetrics(glyph))
        return "widths are missing";
    m_points = 0;
    m_components = 0;
    return measureGlyph(glyph, 0).fault;
}

inline FontTables::Outline FontTables::measureGlyph(uint32_t glyph, int depth)
{
    if (glyph >= m_glyphCount)
        return {0.0f, "a composite glyph refers to a missing one"};
    const std::size_t start =
        m_hasWideLocations ? m_locations.u32(4 * std::size_t(glyph)) : 2 * m_locations.u16(2 * glyph);
    const std::size_t end = m_hasWideLocations ? m_locations.u32(4 * std::size_t(glyph) + 4)
                                               : 2 * m_locations.u16(2 * std::size_t(glyph) + 2);
    if (!m_locations.isSound() || start > end || end > m_glyphs.size())
        return {0.0f, "a glyph lies outside of its table"};
    if (start == end)
        return {};

    FontBytes data = m_glyphs.part(start, end - start);
    const int contourCount = data.s16(0);
    const bool isBoxed = data.s16(2) <= data.s16(6) && data.s16(4) <= data.s16(8);
    if (!data.isSound() || !isBoxed)
        return {0.0f, "a glyph's box is damaged"};
    if (contourCount > 0)
        return measureContours(data, unsigned(contourCount));
    return contourCount < 0 ? measureComponents(data, depth) : Outline{};
}

inline FontTables::Outline FontTables::measureContours(FontBytes& glyph, unsigned contourCount)
{
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
    return measurePoints(glyph, flagsStart, pointCount, lastStart == end);
}

/// The flags of all points come first, then all x, then all y.
inline FontTables::Outline FontTables::measurePoints(FontBytes& glyph, std::size_t flagsStart, int pointCount,
                                                     bool endsInOnePoint)
{
    const unsigned ON_CURVE = 1;
    FontAxis x = {2, 16};
    FontAxis y = {4, 32};
    unsigned lastFlag = 0;
    x.at = forEachFlag(glyph, flagsStart, pointCount,
                       [&](unsigned flag)
                       {
                           y.at += x.getSize(flag);
                           lastFlag = flag;
                       });
    y.at += x.at;
    // Looking for a point on the curve to start from, the rasteriser goes on to the next point, whatever is there.
    if (endsInOnePoint && !(lastFlag & ON_CURVE))
        return {0.0f, DAMAGED_OUTLINE};

    int reach = 0;
    forEachFlag(glyph, flagsStart, pointCount,
                [&](unsigned flag) {
                    reach = std::max({reach, x.read(glyph, flag), y.read(glyph, flag)});
                });
    if (!glyph.isSound() || reach > INT16_MAX)
        return {0.0f, DAMAGED_OUTLINE};
    return {float(reach), nullptr};
}

inline FontTables::Outline FontTables::measureComponents(FontBytes& glyph, int depth)
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

} // namespace orv::detail
