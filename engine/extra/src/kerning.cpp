#include "kerning.h"

#include <algorithm>
#include <set>

namespace orv::detail
{

namespace
{

constexpr int NOT_COVERED = -1;

/// Searches sorted records, each of which begins with its first and last glyph, for a glyph.
/// @return the record's offset, 0 for none.
std::size_t findRange(FontBytes& table, std::size_t records, std::size_t count, uint32_t glyph)
{
    std::size_t low = 0;
    std::size_t high = count;
    while (low < high)
    {
        const std::size_t middle = (low + high) / 2;
        const std::size_t record = records + 6 * middle;
        if (glyph < table.u16(record))
            high = middle;
        else if (glyph > table.u16(record + 2))
            low = middle + 1;
        else
            return record;
    }
    return 0;
}

/// Searches sorted records that begin with a number. @return the record's offset, 0 for none.
std::size_t findRecord(FontBytes& table, std::size_t records, std::size_t size, std::size_t count,
                       uint32_t number)
{
    std::size_t low = 0;
    std::size_t high = count;
    while (low < high)
    {
        const std::size_t middle = (low + high) / 2;
        const uint32_t found = table.u16(records + size * middle);
        if (found == number)
            return records + size * middle;
        if (found < number)
            low = middle + 1;
        else
            high = middle;
    }
    return 0;
}

/// @return the glyph's index among those that a table covers, or NOT_COVERED.
int findCoverage(FontBytes coverage, uint32_t glyph)
{
    const unsigned count = coverage.u16(2);
    if (coverage.u16(0) == 1)
    {
        const std::size_t record = findRecord(coverage, 4, 2, count, glyph);
        return record == 0 ? NOT_COVERED : int((record - 4) / 2);
    }
    const std::size_t range = coverage.u16(0) == 2 ? findRange(coverage, 4, count, glyph) : 0;
    return range == 0 ? NOT_COVERED : int(coverage.u16(range + 4) + glyph - coverage.u16(range));
}

/// Every glyph has a class, most have 0.
unsigned findClass(FontBytes classes, uint32_t glyph)
{
    if (classes.u16(0) == 1)
    {
        const uint32_t index = glyph - classes.u16(2);
        return index < classes.u16(4) ? classes.u16(6 + 2 * std::size_t(index)) : 0;
    }
    const std::size_t range = classes.u16(0) == 2 ? findRange(classes, 4, classes.u16(2), glyph) : 0;
    return range == 0 ? 0 : classes.u16(range + 4);
}

/// Size of a value record: two bytes for each bit that is set.
std::size_t getValueSize(unsigned format)
{
    std::size_t size = 0;
    for (; format != 0; format &= format - 1)
        size += 2;
    return size;
}

/// @param left  how many records may still be read; counted down.
/// @return the lookups that a script uses for kerning.
std::set<unsigned> findKerning(FontBytes script, FontBytes& features, int& left)
{
    std::set<unsigned> lookups;
    const unsigned languageAt = script.u16(0); // the default one
    FontBytes language = script.rest(languageAt);
    const unsigned featureCount = languageAt == 0 ? 0 : language.u16(4);
    for (unsigned i = 0; i < featureCount && language.isSound() && left > 0; ++i, --left)
    {
        const std::size_t record = 2 + 6 * std::size_t(language.u16(6 + 2 * std::size_t(i)));
        if (features.u32(record) != makeFontTag("kern"))
            continue;
        FontBytes feature = features.rest(features.u16(record + 4));
        const unsigned count = feature.u16(2);
        for (unsigned j = 0; j < count && feature.isSound() && left > 0; ++j, --left)
            lookups.insert(feature.u16(4 + 2 * std::size_t(j)));
    }
    return lookups;
}

} // namespace

void Kerning::read(FontTables tables)
{
    FontBytes table;
    FontTables others = tables;
    if (tables.findTable(makeFontTag("GPOS"), table))
        readScripts(table);
    if (m_adjustments.empty() && others.findTable(makeFontTag("kern"), table))
        readPairs(table);
}

/// Notes the lookups that the feature "kern" has for each script, in its default language.
void Kerning::readScripts(FontBytes positions)
{
    FontBytes scripts = positions.rest(positions.u16(4));
    FontBytes features = positions.rest(positions.u16(6));
    FontBytes lookups = positions.rest(positions.u16(8));
    std::vector<std::set<unsigned>> found;
    std::set<unsigned> general;
    int left = MOST_RECORDS;
    const unsigned count = scripts.u16(0);
    for (unsigned i = 0; i < count && left > 0; ++i, --left)
    {
        const std::size_t record = 2 + 6 * std::size_t(i);
        const std::set<unsigned> own = findKerning(scripts.rest(scripts.u16(record + 4)), features, left);
        if (scripts.u32(record) == makeFontTag("DFLT"))
            general = own;
        else if (std::find(found.begin(), found.end(), own) == found.end())
            found.push_back(own);
    }
    if (std::find(found.begin(), found.end(), general) == found.end())
        found.push_back(general);
    for (unsigned script = 0; script < found.size(); ++script)
    {
        for (const unsigned index : found[script])
            addLookup(lookups, script, index);
    }
}

void Kerning::addLookup(FontBytes& lookups, unsigned script, unsigned index)
{
    const unsigned PAIR_ADJUSTMENT = 2, EXTENSION = 9;
    if (index >= lookups.u16(0))
        return;
    FontBytes lookup = lookups.rest(lookups.u16(2 + 2 * std::size_t(index)));
    const unsigned type = lookup.u16(0);
    const unsigned count = lookup.u16(4);
    for (unsigned i = 0; i < count && lookup.isSound() && m_adjustments.size() < MOST_TABLES; ++i)
    {
        FontBytes table = lookup.rest(lookup.u16(6 + 2 * std::size_t(i)));
        unsigned tableType = type;
        if (type == EXTENSION && table.u16(0) == 1)
        {
            tableType = table.u16(2);
            table = table.rest(table.u32(4));
        }
        if (tableType == PAIR_ADJUSTMENT && table.isSound())
            m_adjustments.push_back({table, script, index});
    }
}

/// Notes the horizontal lists of pairs.
void Kerning::readPairs(FontBytes kern)
{
    const unsigned HORIZONTAL = 1, MINIMUM = 2, CROSS_STREAM = 4;
    const std::size_t HEADER_SIZE = 14;
    const unsigned count = kern.u16(0) == 0 ? kern.u16(2) : 0;
    std::size_t at = 4;
    for (unsigned i = 0; i < count && m_pairs.size() < MOST_TABLES; ++i)
    {
        const std::size_t length = kern.u16(at + 2);
        const unsigned coverage = kern.u16(at + 4);
        const std::size_t size = 6 * std::size_t(kern.u16(at + 6));
        FontBytes whole = kern;
        const FontBytes pairs = whole.part(at + HEADER_SIZE, size);
        const bool isWanted =
            (coverage & (HORIZONTAL | MINIMUM | CROSS_STREAM)) == HORIZONTAL && coverage >> 8 == 0;
        if (isWanted && pairs.isSound() && kern.isSound())
            m_pairs.push_back(pairs); // ignores the length: its field is too small for many pairs
        if (!kern.isSound() || length < HEADER_SIZE)
            return;
        at += length;
    }
}

int Kerning::find(uint32_t left, uint32_t right) const
{
    int sum = 0;
    for (std::size_t i = 0; i < m_adjustments.size(); ++i)
    {
        const Table& table = m_adjustments[i];
        if (sum != 0 && table.script != m_adjustments[i - 1].script)
            return sum;
        int advance = 0;
        if (!findAdjustment(table.bytes, left, right, advance))
            continue;
        sum += advance;
        while (i + 1 < m_adjustments.size() && m_adjustments[i + 1].lookup == table.lookup &&
               m_adjustments[i + 1].script == table.script)
            ++i;
    }
    for (FontBytes pairs : m_pairs)
    {
        std::size_t low = 0;
        std::size_t high = pairs.size() / 6;
        const uint32_t wanted = left << 16 | right;
        while (low < high)
        {
            const std::size_t middle = (low + high) / 2;
            const uint32_t pair = pairs.u32(6 * middle);
            if (pair == wanted)
                sum += pairs.s16(6 * middle + 4);
            if (pair >= wanted)
                high = middle;
            if (pair <= wanted)
                low = middle + 1;
        }
    }
    return sum;
}

/// @return whether the table has the pair; advance is then its value.
bool Kerning::findAdjustment(FontBytes table, uint32_t left, uint32_t right, int& advance) const
{
    const unsigned PLACEMENTS = 3, ADVANCE = 4;
    const unsigned format = table.u16(4);
    const std::size_t size = getValueSize(format) + getValueSize(table.u16(6));
    const std::size_t advanceAt = getValueSize(format & PLACEMENTS);
    const int index = findCoverage(table.rest(table.u16(2)), left);
    if (index == NOT_COVERED)
        return false;

    std::size_t value = 0;
    FontBytes values = table;
    if (table.u16(0) == 1 && unsigned(index) < table.u16(8))
    {
        values = table.rest(table.u16(10 + 2 * std::size_t(index)));
        const std::size_t record = findRecord(values, 2, 2 + size, values.u16(0), right);
        value = record == 0 ? 0 : record + 2;
    }
    else if (table.u16(0) == 2)
    {
        const std::size_t leftClass = findClass(table.rest(table.u16(8)), left);
        const std::size_t rightClass = findClass(table.rest(table.u16(10)), right);
        const std::size_t rightCount = table.u16(14);
        if (leftClass < table.u16(12) && rightClass < rightCount)
            value = 16 + size * (leftClass * rightCount + rightClass);
    }
    if (value == 0)
        return false;
    const int found = format & ADVANCE ? values.s16(value + advanceAt) : 0;
    advance = values.isSound() && table.isSound() ? found : 0;
    return true;
}

} // namespace orv::detail
