#pragma once

#include "orv/detail/fonttables.h"

#include <vector>

namespace orv::detail
{

/// Kerning: corrections of advances by pairs of glyphs.
///
/// Reads the pair adjustments of the font's feature "kern" (table GPOS) or, without any, the table "kern". Scripts are
/// searched one after the other, the default script last; the first one with a value for a pair counts. Only the first
/// 128 tables of pairs are used, to limit the time of a query. Damaged tables give 0.
class Kerning
{
public:
    /// @param tables  a copy: damage found here marks it as faulty.
    void read(FontTables tables);

    /// @return in the font's units.
    int find(uint32_t left, uint32_t right) const;

private:
    static constexpr std::size_t MOST_TABLES = 128;
    static constexpr int MOST_RECORDS = 4096; ///< read, for all scripts together

    /// Pairs, or pairs of classes.
    struct Table
    {
        FontBytes bytes;
        unsigned script; ///< the same number for scripts with the same lookups
        unsigned lookup; ///< the first one that has the left glyph counts
    };

    void readScripts(FontBytes positions);
    void addLookup(FontBytes& lookups, unsigned script, unsigned index);
    void readPairs(FontBytes kern);
    bool findAdjustment(FontBytes table, uint32_t left, uint32_t right, int& advance) const;

    std::vector<Table> m_adjustments; ///< sorted by script and lookup
    std::vector<FontBytes> m_pairs;   ///< each six bytes a pair, sorted
};

} // namespace orv::detail
