#pragma once

#include "orv/detail/fonttables.h"

#include <vector>

namespace orv::detail
{

/// How much closer two glyphs stand than their advances say.
///
/// Read are the pair adjustments of the font's feature "kern" (table GPOS); without any, the pairs of the table "kern". What
/// is said for several scripts is asked script by script, for none in particular last: the first that moves a pair counts.
/// Of a file with more than 128 tables of pairs the rest is left out, so that a question has a price. Damage makes a
/// distance of 0.
class Kerning
{
public:
    /// @param tables  a copy, which may become unsound.
    void read(FontTables tables);

    /// @return in the font's units.
    int find(uint32_t left, uint32_t right) const;

private:
    static constexpr std::size_t MOST_TABLES = 128;
    static constexpr int MOST_RECORDS = 4096; ///< looked at, of all scripts together

    /// Pairs, or pairs of classes.
    struct Table
    {
        FontBytes bytes;
        unsigned script; ///< a number for those with the same lookups
        unsigned lookup; ///< of those with the same number the first counts that has the left glyph
    };

    void readScripts(FontBytes positions);
    void addLookup(FontBytes& lookups, unsigned script, unsigned index);
    void readPairs(FontBytes kern);
    bool findAdjustment(FontBytes table, uint32_t left, uint32_t right, int& advance) const;

    std::vector<Table> m_adjustments; ///< sorted by script and lookup
    std::vector<FontBytes> m_pairs;   ///< each six bytes a pair, sorted
};

} // namespace orv::detail
