#pragma once

#include "orv/detail/fonttables.h"

#include <vector>

namespace orv::detail
{

/// A numbered list of stretches of bytes, as PostScript outlines have them for programs and dictionaries.
class CffIndex
{
public:
    /// @param at  where the list begins in the table; moved behind it.
    /// @return false if it does not end within the table.
    bool read(FontBytes table, std::size_t& at);

    unsigned getCount() const { return m_count; }

    /// @return an unsound stretch for a number that is not there, or one that lies outside of the list.
    FontBytes get(unsigned number) const;

private:
    std::size_t readOffset(FontBytes& offsets, unsigned number) const;

    FontBytes m_offsets;
    FontBytes m_data; ///< from the byte before the first, since offsets count from 1
    unsigned m_count = 0;
    unsigned m_offsetSize = 1;
};

/// The table "CFF ", version 1: a program for each glyph, in the font's own units, and the subroutines that they call.
///
/// Whatever the file says, nothing outside of the table is read, and reading it takes no longer than its size accounts for.
class CffTable
{
public:
    /// @return null, or what is wrong, for a log.
    const char* read(FontBytes table);

    /// A program, and what it may call.
    struct Program
    {
        FontBytes bytes; ///< unsound if the glyph is not there
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
    std::vector<CffIndex> m_local; ///< for each part of the font; a font that is in one piece has one
    FontBytes m_selection;         ///< which part a glyph belongs to: nothing if there is one
    unsigned m_selectionFormat = 0;
};

} // namespace orv::detail
