#pragma once

#include "orv/detail/fonttables.h"

#include <vector>

namespace orv::detail
{

/// How much closer two glyphs stand than their advances say.
///
/// Read are the pair adjustments that the font's feature "kern" uses, of any script (table GPOS); without that feature,
/// the pairs of the table "kern". Of a file with more than 64 such tables the rest is left out, so that a question has a
/// price. Damage makes a distance of 0.
class Kerning
{
public:
    /// @param tables  a copy, which may become unsound.
    void read(FontTables tables);

    /// @return in the font's units.
    int find(uint32_t left, uint32_t right) const;

private:
    static constexpr std::size_t MOST_TABLES = 64;
    static constexpr unsigned MOST_LOOKUPS = 1024; ///< looked at, of all scripts and languages together

    /// Pairs, or pairs of classes.
    struct Table
    {
        FontBytes bytes;
        unsigned lookup; ///< of those with the same number the first counts that has the left glyph
    };

    void readFeatures(FontBytes positions);
    void addLookup(FontBytes& lookups, unsigned index);
    void readPairs(FontBytes kern);
    bool findAdjustment(FontBytes table, uint32_t left, uint32_t right, int& advance) const;

    std::vector<Table> m_adjustments; ///< sorted by lookup
    std::vector<FontBytes> m_pairs;   ///< each six bytes a pair, sorted
};

} // namespace orv::detail
