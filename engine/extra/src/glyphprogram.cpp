#include "glyphprogram.h"

#include <algorithm>
#include <cstdlib>

namespace orv::detail
{

namespace
{

constexpr const char* DAMAGED_OUTLINE = "a glyph's outline is damaged";
constexpr const char* TOO_COMPLICATED = "its outline is too complicated";
constexpr int64_t ONE = 65536;

/// Added to the operand of a call, so that small operands reach more subroutines.
int getBias(unsigned count)
{
    return count < 1240 ? 107 : count < 33900 ? 1131 : 32768;
}

} // namespace

const char* GlyphProgram::run(const CffTable::Program& program, std::vector<OutlineStep>& steps)
{
    *this = {};
    steps.clear();
    m_program = program;
    m_steps = &steps;
    m_calls[0] = {program.bytes, 0};
    if (!program.bytes.isSound())
        return "a glyph lies outside of its table";
    while (!m_isFinished && !m_fault)
        step();
    return m_fault;
}

void GlyphProgram::fail(const char* fault)
{
    m_fault = m_fault ? m_fault : fault;
}

/// Reads a number or a command. A program or subroutine may end without endchar or return.
void GlyphProgram::step()
{
    const unsigned WORD = 28, FIRST_NUMBER = 32;
    if (++m_stepsDone > MOST_STEPS)
        return fail(TOO_COMPLICATED);
    Call& now = m_calls[m_depth];
    if (now.at >= now.bytes.size())
    {
        m_isFinished = m_depth == 0;
        m_depth -= m_isFinished ? 0 : 1;
        return;
    }
    const unsigned first = now.bytes.u8(now.at++);
    m_next = 0;
    if (first == WORD || first >= FIRST_NUMBER)
        readNumber(first);
    else
        perform(first);
}

void GlyphProgram::readNumber(unsigned first)
{
    const unsigned FIXED = 255; // 16.16
    if (m_count == MOST_OPERANDS)
        return fail(DAMAGED_OUTLINE);
    Call& now = m_calls[m_depth];
    if (first == FIXED)
    {
        m_operands[m_count++] = int32_t(now.bytes.u32(now.at));
        now.at += 4;
    }
    else
        m_operands[m_count++] = readCffNumber(now.bytes, now.at, first) * ONE;
    if (!now.bytes.isSound())
        fail(DAMAGED_OUTLINE);
}

/// Every command but call and return uses all operands.
void GlyphProgram::perform(unsigned command)
{
    switch (command)
    {
    case 10: return call(m_program.local);
    case 29: return call(m_program.global);
    case 11: m_calls[m_depth].at = m_calls[m_depth].bytes.size(); return;
    case 14:
        m_isFinished = true;
        if (m_count >= 4)
            fail("a glyph is put together of two others, as old fonts do");
        break;
    case 1:
    case 3:
    case 18:
    case 23: addStems(); break;
    case 19:
    case 20: skipMask(); break;
    case 21: drawMove(2, false); break;
    case 22: drawMove(1, false); break;
    case 4: drawMove(1, true); break;
    case 5: drawLines(m_count); break;
    case 6: drawAxisLines(false); break;
    case 7: drawAxisLines(true); break;
    case 8: drawCurves(m_count); break;
    case 24:
        drawCurves(std::max(m_count, 2u) - 2);
        drawLines(m_count);
        break;
    case 25:
        drawLines(std::max(m_count, 6u) - 6);
        drawCurves(m_count);
        break;
    case 26: drawTangentCurves(true); break;
    case 27: drawTangentCurves(false); break;
    case 30: drawAxisCurves(true); break;
    case 31: drawAxisCurves(false); break;
    case 12: performEscaped(); break;
    default: fail(DAMAGED_OUTLINE);
    }
    m_count = 0;
}

void GlyphProgram::call(const CffIndex* subroutines)
{
    if (!subroutines || !needs(1) || m_depth + 1 == MOST_CALLS)
        return fail(DAMAGED_OUTLINE);
    const int64_t number = m_operands[--m_count] / ONE + getBias(subroutines->getCount());
    const bool isThere = number >= 0 && number < int64_t(subroutines->getCount());
    const FontBytes bytes = isThere ? subroutines->get(unsigned(number)) : FontBytes();
    if (!isThere || !bytes.isSound())
        return fail(DAMAGED_OUTLINE);
    m_calls[++m_depth] = {bytes, 0};
}

void GlyphProgram::addStems()
{
    m_stems += m_count / 2;
}

/// The mask has a bit for each stem. Operands before the first mask are stems too.
void GlyphProgram::skipMask()
{
    addStems();
    Call& now = m_calls[m_depth];
    now.at += (m_stems + 7) / 8;
    if (now.at > now.bytes.size())
        fail(DAMAGED_OUTLINE);
}

bool GlyphProgram::needs(unsigned count)
{
    if (m_count < count)
        fail(DAMAGED_OUTLINE);
    return m_count >= count;
}

/// The first move may have an extra operand in front, the glyph's width, which is not used.
void GlyphProgram::drawMove(unsigned count, bool isUpright)
{
    if (!needs(count))
        return;
    const int64_t last = m_operands[m_count - 1];
    m_x += count == 2 ? m_operands[m_count - 2] : isUpright ? 0 : last;
    m_y += count == 2 || isUpright ? last : 0;
    m_isOpen = false;
}

void GlyphProgram::drawLines(unsigned end)
{
    for (; m_next + 2 <= end; m_next += 2)
        addLine(m_operands[m_next], m_operands[m_next + 1]);
}

void GlyphProgram::drawAxisLines(bool isUpright)
{
    for (; m_next < m_count; ++m_next)
    {
        const int64_t length = m_operands[m_next];
        addLine(isUpright ? 0 : length, isUpright ? length : 0);
        isUpright = !isUpright;
    }
}

void GlyphProgram::drawCurves(unsigned end)
{
    for (; m_next + 6 <= end; m_next += 6)
    {
        const int64_t* const d = &m_operands[m_next];
        addCurve(d[0], d[1], d[2], d[3], d[4], d[5]);
    }
}

/// Curves that begin along one axis and end along the other, alternating; the last may end at any angle.
void GlyphProgram::drawAxisCurves(bool isUpright)
{
    for (; m_next + 4 <= m_count; m_next += 4)
    {
        const int64_t* const d = &m_operands[m_next];
        const int64_t askew = m_count - m_next == 5 ? d[4] : 0;
        if (isUpright)
            addCurve(0, d[0], d[1], d[2], d[3], askew);
        else
            addCurve(d[0], 0, d[1], d[2], askew, d[3]);
        isUpright = !isUpright;
    }
}

/// Curves that begin and end along the same axis; the first may begin at any angle.
void GlyphProgram::drawTangentCurves(bool isUpright)
{
    int64_t askew = m_count % 2 == 1 ? m_operands[m_next++] : 0;
    for (; m_next + 4 <= m_count; m_next += 4)
    {
        const int64_t* const d = &m_operands[m_next];
        if (isUpright)
            addCurve(askew, d[0], d[1], d[2], 0, d[3]);
        else
            addCurve(d[0], askew, d[1], d[2], d[3], 0);
        askew = 0;
    }
}

/// Of these commands the four flexes are supported: pairs of curves that are nearly a line.
void GlyphProgram::performEscaped()
{
    Call& now = m_calls[m_depth];
    const unsigned command = now.bytes.u8(now.at++);
    const int64_t* const d = m_operands.data();
    if (command == 34 && needs(7))
    {
        addCurve(d[0], 0, d[1], d[2], d[3], 0);
        addCurve(d[4], 0, d[5], -d[2], d[6], 0);
    }
    else if (command == 35 && needs(12))
        drawCurves(12);
    else if (command == 36 && needs(9))
    {
        addCurve(d[0], d[1], d[2], d[3], d[4], 0);
        addCurve(d[5], 0, d[6], d[7], d[8], -(d[1] + d[3] + d[7]));
    }
    else if (command == 37 && needs(11))
        drawLongFlex();
    else
        fail(DAMAGED_OUTLINE);
}

/// The last point returns to the first one's y if the flex is wider than high, else to its x.
void GlyphProgram::drawLongFlex()
{
    const int64_t* const d = m_operands.data();
    const int64_t dx = d[0] + d[2] + d[4] + d[6] + d[8];
    const int64_t dy = d[1] + d[3] + d[5] + d[7] + d[9];
    const bool isLevel = std::abs(dx) > std::abs(dy);
    drawCurves(6);
    addCurve(d[6], d[7], d[8], d[9], isLevel ? d[10] : -dx, isLevel ? -dy : d[10]);
}

/// Begins a contour at the pen, unless one has begun.
void GlyphProgram::beginContour()
{
    if (!m_isOpen)
        m_steps->push_back({OutlineStep::Kind::MOVE, round(m_x), round(m_y), 0, 0, 0, 0});
    m_isOpen = true;
    if (m_steps->size() >= MOST_POINTS)
        fail("a glyph has too many points");
}

void GlyphProgram::addLine(int64_t dx, int64_t dy)
{
    if (m_fault)
        return;
    beginContour();
    m_x += dx;
    m_y += dy;
    m_steps->push_back({OutlineStep::Kind::LINE, round(m_x), round(m_y), 0, 0, 0, 0});
}

void GlyphProgram::addCurve(int64_t dx1, int64_t dy1, int64_t dx2, int64_t dy2, int64_t dx3, int64_t dy3)
{
    if (m_fault)
        return;
    beginContour();
    const int64_t x1 = m_x + dx1, y1 = m_y + dy1;
    const int64_t x2 = x1 + dx2, y2 = y1 + dy2;
    m_x = x2 + dx3;
    m_y = y2 + dy3;
    m_steps->push_back(
        {OutlineStep::Kind::CURVE, round(m_x), round(m_y), round(x1), round(y1), round(x2), round(y2)});
}

/// To units of the font. A result beyond 16 bits is a fault.
int16_t GlyphProgram::round(int64_t fixed)
{
    const int64_t rounded = (fixed + ONE / 2) >> 16;
    if (rounded == int16_t(rounded))
        return int16_t(rounded);
    fail(DAMAGED_OUTLINE);
    return 0;
}

} // namespace orv::detail
