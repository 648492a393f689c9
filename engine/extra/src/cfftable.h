#pragma once

#include "orv/detail/fonttables.h"

#include <vector>

namespace orv::detail
{

/// Reads an integer of a dictionary or a program.
/// @param at     in: the byte after the first; out: the end of the number.
/// @param first  the number's first byte: 28, or 32 to 254.
int readCffNumber(FontBytes& bytes, std::size_t& at, unsigned first);

/// An INDEX: a numbered list of byte ranges, used for programs and dictionaries.
class CffIndex
{
public:
    /// @param at  in: where the list begins in the table; out: its end.
    /// @return false if the list ends beyond the table.
    bool read(FontBytes table, std::size_t& at);

    unsigned getCount() const { return m_count; }

    /// @return unsound bytes for a number or a range outside of the list.
    FontBytes get(unsigned number) const;

private:
    std::size_t readOffset(FontBytes& offsets, unsigned number) const;

    FontBytes m_offsets;
    FontBytes m_data; ///< begins one byte early, since offsets count from 1
    unsigned m_count = 0;
    unsigned m_offsetSize = 1;
};

/// The table "CFF ", version 1: a program for each glyph, in the font's own units, and their subroutines.
///
/// Nothing outside of the table is read, and the time is linear in its size.
class CffTable
{
public:
    /// @return null, or the fault.
    const char* read(FontBytes table);

    /// A program and the subroutines that it may call.
    struct Program
    {
        FontBytes bytes; ///< unsound for a missing glyph
        const CffIndex* global = nullptr;
        const CffIndex* local = nullptr; ///< null: none
    };
    Program getProgram(uint32_t glyph) const;

private:
    struct Dictionary;

    static bool readDictionary(FontBytes bytes, Dictionary& dictionary);
    static bool readSubroutines(FontBytes table, const Dictionary& owner, CffIndex& subroutines);
    bool readParts(FontBytes table, const Dictionary& top);
    bool readSelection(FontBytes table, std::size_t at);
    unsigned findPart(uint32_t glyph) const;

    CffIndex m_programs;
    CffIndex m_global;
    std::vector<CffIndex> m_local; ///< one for each part of the font
    FontBytes m_selection;         ///< the part of each glyph; empty if there is only one
    unsigned m_selectionFormat = 0;
};

} // namespace orv::detail
