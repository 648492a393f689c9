#include "orv/tokenreader.h"

#include "orv/filetostring.h"
#include "orv/memorystream.h"

#include <gtest/gtest.h>

#include <cmath>
#include <string>

using namespace orv;

namespace
{

/// A text as FileToString would hold it.
struct Text
{
    explicit Text(const std::string& content)
        : buffer(content)
        , range{buffer.data(), buffer.data() + buffer.size()}
    {
    }

    std::string rest() const { return std::string(range.start, range.end); }

    std::string buffer;
    CharRange range;
};

std::string toText(const CharRange& token)
{
    return std::string(token.start, token.end);
}

} // namespace

// Fault caught: quotes or ends of the buffer handled wrongly, which garbles every name in a material.
TEST(TokenReader, tokens)
{
    const struct
    {
        const char* input;
        const char* token;
        const char* rest;
    } cases[] = {{"  \"a b\" c", "a b", " c"}, {"abc def", "abc", "def"}, {"\t\r\n\v\fx", "x", ""},
                 {"\"open", "open", ""},       {"\"\" x", "", " x"},      {"   ", "", ""},
                 {"a\"b c", "a\"b", "c"},      {"one\ntwo", "one", "two"}};
    for (const auto& test : cases)
    {
        Text text(test.input);
        EXPECT_EQ(test.token, toText(readToken(text.range))) << test.input;
        EXPECT_EQ(test.rest, text.rest()) << test.input;
    }

    Text text("one two");
    EXPECT_STREQ("one", readToken(text.range).start) << "not terminated in place";

    // A range that is a part of a larger text never reads on, even where the next character is a quote.
    Text part("ab \"cd\" e");
    part.range.end = part.range.start + 3;
    EXPECT_EQ("ab", toText(readToken(part.range)));
    EXPECT_TRUE(readToken(part.range).empty());
    EXPECT_TRUE(part.range.empty());
}

TEST(TokenReader, floats)
{
    const struct
    {
        const char* input;
        float value;
        const char* rest;
    } cases[] = {{"1.5e2", 150.0f, ""}, {"-.25", -0.25f, ""},  {"x", 0.0f, "x"},    {"abc", 0.0f, "abc"},
                 {"  ", 99.0f, ""},     {"", 99.0f, ""},       {"-", 99.0f, ""},    {"+7 8", 7.0f, " 8"},
                 {".", 0.0f, ""},       {"2.", 2.0f, ""},      {"25e-1", 2.5f, ""}, {"3E+1x", 30.0f, "x"},
                 {"1e", 1.0f, ""},      {"0x10", 0.0f, "x10"}, {"-0e99", -0.0f, ""}};
    for (const auto& test : cases)
    {
        Text text(test.input);
        const float value = readFloat(text.range, 99.0f);
        EXPECT_FLOAT_EQ(test.value, value) << test.input;
        EXPECT_EQ(std::signbit(test.value), std::signbit(value)) << test.input;
        EXPECT_EQ(test.rest, text.rest()) << test.input;
    }
}

TEST(TokenReader, integersAndBooleans)
{
    const struct
    {
        const char* input;
        int asInt;
        const char* restOfInt;
        unsigned int asUnsigned;
        bool asBool;
    } cases[] = {{"12 3", 12, " 3", 12, true},
                 {"-x", 99, "x", 98, false},
                 {"-40", -40, "", 98, false},
                 {"+5", 5, "", 98, false},
                 {"", 99, "", 98, false},
                 {"True", 99, "True", 98, true},
                 {"t", 99, "t", 98, true},
                 {"0", 0, "", 0, false},
                 {"4294967295", -1, "", 4294967295u, false},
                 {"-2147483648", -2147483647 - 1, "", 98, false}};
    for (const auto& test : cases)
    {
        Text forInt(test.input), forUnsigned(test.input), forBool(test.input);
        EXPECT_EQ(test.asInt, readInt(forInt.range, 99)) << test.input;
        EXPECT_EQ(test.restOfInt, forInt.rest()) << test.input;
        EXPECT_EQ(test.asUnsigned, readUInt(forUnsigned.range, 98)) << test.input;
        EXPECT_EQ(test.asBool, readBool(forBool.range)) << test.input;
    }
}

TEST(TokenReader, requiredCharacter)
{
    Text missing("  x");
    EXPECT_FALSE(requireChar(missing.range, '{'));
    EXPECT_EQ("x", missing.rest());
    Text present(" {x");
    EXPECT_TRUE(requireChar(present.range, '{'));
    EXPECT_EQ("x", present.rest());
    Text blank("  ");
    EXPECT_FALSE(requireChar(blank.range, '\0')) << "the byte behind the range is not part of it";
}
