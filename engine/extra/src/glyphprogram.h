#pragma once

#include "cfftable.h"

#include <array>
#include <cstdint>
#include <vector>

namespace orv::detail
{

/// One step of an outline, in the font's own units: y counts upwards.
struct OutlineStep
{
    enum class Kind : uint8_t
    {
        MOVE,
        LINE,
        CURVE, ///< cubic, by two control points
    };
    Kind kind;
    int16_t x, y;
    int16_t x1, y1; ///< of a curve: the first control point
    int16_t x2, y2;
};

/// Runs the program of a glyph (a Type 2 charstring) and records the outline that it draws.
///
/// Subroutines can be nested ten deep, so a few bytes can ask for any number of steps: steps and points are limited.
/// Hints are skipped. Arithmetic operators and accented letters composed by endchar count as faults: none of the 208 fonts
/// that were tried has them.
class GlyphProgram
{
public:
    /// @param steps  receives the outline; its memory is reused. Each contour begins with a move.
    /// @return null, or why there is no outline.
    const char* run(const CffTable::Program& program, std::vector<OutlineStep>& steps);

private:
    struct Call
    {
        FontBytes bytes;
        std::size_t at = 0;
    };

    static constexpr unsigned MOST_OPERANDS = 48;
    static constexpr unsigned MOST_CALLS = 11;    ///< including the glyph's program
    static constexpr unsigned MOST_STEPS = 32768; ///< the fonts that were tried need up to 6,923
    static constexpr std::size_t MOST_POINTS = 16384;

    void step();
    void readNumber(unsigned first);
    void perform(unsigned command);
    void performEscaped();
    void call(const CffIndex* subroutines);
    void addStems();
    void skipMask();
    void drawMove(unsigned count, bool isUpright);
    void drawLines(unsigned end);
    void drawAxisLines(bool isUpright);
    void drawCurves(unsigned end);
    void drawAxisCurves(bool isUpright);
    void drawTangentCurves(bool isUpright);
    void drawLongFlex();
    void addLine(int64_t dx, int64_t dy);
    void addCurve(int64_t dx1, int64_t dy1, int64_t dx2, int64_t dy2, int64_t dx3, int64_t dy3);
    void beginContour();
    int16_t round(int64_t fixed);
    bool needs(unsigned count);
    void fail(const char* fault);

    CffTable::Program m_program;
    std::vector<OutlineStep>* m_steps = nullptr;
    const char* m_fault = nullptr;
    std::array<int64_t, MOST_OPERANDS> m_operands = {}; ///< 16.16 fixed point, as are m_x and m_y
    unsigned m_count = 0;                               ///< operands
    unsigned m_next = 0;                                ///< the first unused operand
    std::array<Call, MOST_CALLS> m_calls = {};
    unsigned m_depth = 0;
    unsigned m_stems = 0;
    unsigned m_stepsDone = 0;
    int64_t m_x = 0, m_y = 0;
    bool m_isOpen = false; ///< a contour has begun
    bool m_isFinished = false;
};

} // namespace orv::detail
