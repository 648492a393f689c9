#include "orv/tokenreader.h"

#include <cctype>
#include <cmath>

namespace orv
{

namespace
{

bool isSpace(char c)
{
    return std::isspace(static_cast<unsigned char>(c)) != 0;
}

bool isDigit(char c)
{
    return std::isdigit(static_cast<unsigned char>(c)) != 0;
}

bool startsWithDigit(const CharRange& range)
{
    return !range.empty() && isDigit(*range.start);
}

bool startsWith(const CharRange& range, char c)
{
    return !range.empty() && *range.start == c;
}

/// Consumes a sign. @return whether it was a minus.
bool readSign(CharRange& range)
{
    const bool isNegative = startsWith(range, '-');
    if (isNegative || startsWith(range, '+'))
        ++range.start;
    return isNegative;
}

unsigned int readDigits(CharRange& range)
{
    unsigned int value = 0;
    for (; startsWithDigit(range); ++range.start)
        value = value * 10 + unsigned(*range.start - '0');
    return value;
}

float readFloatDigits(CharRange& range)
{
    float value = 0.0f;
    for (; startsWithDigit(range); ++range.start)
        value = value * 10.0f + float(*range.start - '0');
    return value;
}

} // namespace

void eatWhite(CharRange& range)
{
    while (!range.empty() && isSpace(*range.start))
        ++range.start;
}

bool requireChar(CharRange& range, int c)
{
    eatWhite(range);
    if (range.empty() || *range.start != char(c))
        return false;
    ++range.start;
    return true;
}

void readTo(CharRange& range, int c)
{
    while (!range.empty() && *range.start != char(c))
        ++range.start;
}

CharRange readToken(CharRange& range)
{
    eatWhite(range);
    CharRange token{range.start, range.start};
    if (startsWith(range, '"'))
    {
        token.start = ++range.start;
        readTo(range, '"');
    }
    else
    {
        while (!range.empty() && !isSpace(*range.start))
            ++range.start;
    }
    token.end = range.start;
    if (!range.empty())
        *range.start++ = '\0';
    return token;
}

float readFloat(CharRange& range, float defaultValue)
{
    eatWhite(range);
    if (range.empty())
        return defaultValue;

    const bool isNegative = readSign(range);
    if (range.empty() && !isDigit(*range.end))
        return defaultValue;

    float value = readFloatDigits(range);
    if (startsWith(range, '.'))
    {
        ++range.start;
        float weight = 0.1f;
        for (; startsWithDigit(range); ++range.start, weight *= 0.1f)
            value += float(*range.start - '0') * weight;
    }
    if (startsWith(range, 'e') || startsWith(range, 'E'))
    {
        ++range.start;
        const bool isExponentNegative = readSign(range);
        const float exponent = readFloatDigits(range);
        if (value != 0.0f) // a power beyond floats would make NaN of 0
            value *= powf(10.0f, isExponentNegative ? -exponent : exponent);
    }
    return isNegative ? -value : value;
}

int readInt(CharRange& range, int defaultValue)
{
    eatWhite(range);
    const bool isNegative = readSign(range);
    if (!startsWithDigit(range))
        return defaultValue;
    const unsigned int value = readDigits(range);
    return int(isNegative ? 0u - value : value);
}

unsigned int readUInt(CharRange& range, unsigned int defaultValue)
{
    eatWhite(range);
    return startsWithDigit(range) ? readDigits(range) : defaultValue;
}

bool readBool(CharRange& range)
{
    const CharRange token = readToken(range);
    return startsWith(token, '1') || startsWith(token, 't') || startsWith(token, 'T');
}

} // namespace orv
