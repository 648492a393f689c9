#include "cfftable.h"

#include <algorithm>

namespace orv::detail
{

namespace
{

constexpr unsigned MOST_PARTS = 256;          ///< their numbers are bytes
constexpr std::size_t MOST_DICTIONARY = 4096; ///< bytes; hundreds are usual
constexpr unsigned SELECTION_RANGES = 3;      ///< the format of m_selection that has ranges of glyphs
constexpr std::size_t RANGE_SIZE = 3;         ///< bytes: the first glyph of a range, and its part

// The first bytes of what a dictionary holds.
constexpr unsigned ESCAPE = 12; ///< of an operator of two bytes
constexpr unsigned FIRST_OPERAND = 28;
constexpr unsigned LONG = 29;
constexpr unsigned REAL = 30;

FontBytes makeUnsound()
{
    FontBytes bytes;
    bytes.u8(0);
    return bytes;
}

/// @return 0 for a real number: none leads to programs.
uint32_t readOperand(FontBytes& bytes, std::size_t& at, unsigned first)
{
    if (first == LONG)
    {
        at += 4;
        return bytes.u32(at - 4);
    }
    if (first != REAL)
        return uint32_t(readCffNumber(bytes, at, first));
    unsigned digits = 0;
    do
        digits = bytes.u8(at++);
    while (bytes.isSound() && (digits & 15) != 15 && digits >> 4 != 15);
    return 0;
}

} // namespace

int readCffNumber(FontBytes& bytes, std::size_t& at, unsigned first)
{
    if (first == 28)
    {
        at += 2;
        return bytes.s16(at - 2);
    }
    if (first < 247)
        return int(first) - 139;
    const int low = int(bytes.u8(at++)) + 108;
    return first < 251 ? int(first - 247) * 256 + low : -(int(first - 251) * 256 + low);
}

bool CffIndex::read(FontBytes table, std::size_t& at)
{
    m_count = table.u16(at);
    at += 2;
    if (m_count == 0)
        return table.isSound();
    m_offsetSize = table.u8(at++);
    if (m_offsetSize < 1 || m_offsetSize > 4)
        return false;
    m_offsets = table.part(at, std::size_t(m_count + 1) * m_offsetSize);
    at += m_offsets.size();
    const std::size_t end = readOffset(m_offsets, m_count);
    m_data = table.part(at - 1, end);
    at += end - 1;
    return end > 0 && m_data.isSound();
}

std::size_t CffIndex::readOffset(FontBytes& offsets, unsigned number) const
{
    std::size_t offset = 0;
    for (unsigned i = 0; i < m_offsetSize; ++i)
        offset = offset << 8 | offsets.u8(std::size_t(number) * m_offsetSize + i);
    return offset;
}

FontBytes CffIndex::get(unsigned number) const
{
    FontBytes offsets = m_offsets;
    const std::size_t start = number < m_count ? readOffset(offsets, number) : 0;
    const std::size_t end = number < m_count ? readOffset(offsets, number + 1) : 0;
    FontBytes data = m_data;
    return start >= 1 && start <= end ? data.part(start, end - start) : makeUnsound();
}

/// The entries of a dictionary that lead to programs: offsets in the table, 0 for none.
struct CffTable::Dictionary
{
    uint32_t programs = 0;
    uint32_t programType = 2;
    uint32_t parts = 0;
    uint32_t selection = 0;
    uint32_t privateSize = 0;
    uint32_t privateAt = 0;
    uint32_t subroutines = 0; ///< relative to privateAt

    void set(unsigned command, uint32_t valueBefore, uint32_t value)
    {
        switch (command)
        {
        case 17: programs = value; break;
        case 18:
            privateSize = valueBefore;
            privateAt = value;
            break;
        case 19: subroutines = value; break;
        case ESCAPE << 8 | 6: programType = value; break;
        case ESCAPE << 8 | 36: parts = value; break;
        case ESCAPE << 8 | 37: selection = value; break;
        default:;
        }
    }
};

/// Reads a dictionary: operands come before their operator.
bool CffTable::readDictionary(FontBytes bytes, Dictionary& dictionary)
{
    if (bytes.size() > MOST_DICTIONARY)
        return false;
    uint32_t value = 0, valueBefore = 0;
    std::size_t at = 0;
    while (at < bytes.size() && bytes.isSound())
    {
        const unsigned first = bytes.u8(at++);
        if (first < FIRST_OPERAND)
        {
            dictionary.set(first == ESCAPE ? ESCAPE << 8 | bytes.u8(at++) : first, valueBefore, value);
            continue;
        }
        valueBefore = value;
        value = readOperand(bytes, at, first);
    }
    return bytes.isSound();
}

bool CffTable::readSubroutines(FontBytes table, const Dictionary& owner, CffIndex& subroutines)
{
    if (owner.privateSize == 0)
        return true;
    Dictionary own;
    if (!readDictionary(table.part(owner.privateAt, owner.privateSize), own))
        return false;
    std::size_t at = std::size_t(owner.privateAt) + own.subroutines;
    return own.subroutines == 0 || subroutines.read(table, at);
}

const char* CffTable::read(FontBytes table)
{
    const char* const DAMAGED = "its outlines in PostScript form (CFF) are damaged";
    CffIndex names, tops, texts;
    std::size_t at = table.u8(2);
    if (table.u8(0) != 1 || !names.read(table, at) || !tops.read(table, at) || !texts.read(table, at) ||
        !m_global.read(table, at))
        return DAMAGED;
    Dictionary top;
    if (!readDictionary(tops.get(0), top))
        return DAMAGED;
    if (top.programType != 2)
        return "its outlines are PostScript programs of an old type";
    at = top.programs;
    return at != 0 && m_programs.read(table, at) && readParts(table, top) ? nullptr : DAMAGED;
}

/// A font of many scripts has parts, each with its own subroutines.
bool CffTable::readParts(FontBytes table, const Dictionary& top)
{
    m_local.resize(1);
    if (top.parts == 0)
        return readSubroutines(table, top, m_local[0]);
    CffIndex parts;
    std::size_t at = top.parts;
    if (!parts.read(table, at))
        return false;
    m_local.resize(std::min(parts.getCount(), MOST_PARTS));
    for (unsigned i = 0; i < m_local.size(); ++i)
    {
        Dictionary part;
        if (!readDictionary(parts.get(i), part) || !readSubroutines(table, part, m_local[i]))
            return false;
    }
    return readSelection(table, top.selection);
}

bool CffTable::readSelection(FontBytes table, std::size_t at)
{
    m_selectionFormat = table.u8(at);
    if (m_selectionFormat == 0)
        m_selection = table.part(at + 1, m_programs.getCount());
    else if (m_selectionFormat == SELECTION_RANGES)
        m_selection = table.part(at + 3, RANGE_SIZE * table.u16(at + 1));
    else
        return false;
    return at != 0 && m_selection.isSound() && m_selection.size() > 0;
}

unsigned CffTable::findPart(uint32_t glyph) const
{
    FontBytes selection = m_selection;
    if (selection.size() == 0)
        return 0;
    if (m_selectionFormat != SELECTION_RANGES)
        return selection.u8(glyph);
    std::size_t low = 0;
    std::size_t high = selection.size() / RANGE_SIZE;
    while (high - low > 1)
    {
        const std::size_t middle = (low + high) / 2;
        (selection.u16(RANGE_SIZE * middle) <= glyph ? low : high) = middle;
    }
    return selection.u8(RANGE_SIZE * low + 2);
}

CffTable::Program CffTable::getProgram(uint32_t glyph) const
{
    Program program;
    program.bytes = m_programs.get(glyph);
    program.global = &m_global;
    const unsigned part = program.bytes.isSound() ? findPart(glyph) : 0;
    if (part < m_local.size())
        program.local = &m_local[part];
    return program;
}

} // namespace orv::detail
