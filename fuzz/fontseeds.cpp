#include "seedbytes.h"
#include "seeds.h"

namespace hostile
{

namespace
{

Bytes bigs(const std::vector<int>& values, int size = 2)
{
    Bytes bytes;
    for (const int value : values)
        bytes = join({bytes, big(uint32_t(value), size)});
    return bytes;
}

/// Maps each character to one of the glyphs of makeFont().
Bytes makeCharacterMap(int format)
{
    Bytes glyphs;
    for (int i = 0; i < 96; ++i)
        glyphs.push_back(uint8_t(i % 4));
    std::vector<int> wide(glyphs.begin(), glyphs.end());
    switch (format)
    {
    case 0: return join({bigs({0, 262, 0}), Bytes(32), glyphs, Bytes(128)});
    case 4:
        return join(
            {bigs({4, 32 + 2 * 96, 0, 4, 4, 1, 0, 127, 0xffff, 0, 32, 0xffff, 0, 1, 4, 0}), bigs(wide)});
    case 6: return join({bigs({6, 10 + 2 * 96, 0, 32, 96}), bigs(wide)});
    default: return join({bigs({12, 0}), bigs({16 + 24, 0, 2, 32, 33, 1, 65, 66, 2}, 4)});
    }
}

/// The table "kern": glyph 1 before 2, and 2 before 1.
Bytes makeKerning()
{
    return join({bigs({0, 1, 0, 14 + 12, 1, 2, 12, 1, 0}), bigs({1, 2, -50, 2, 1, 30})});
}

/// The table "GPOS": a list of pairs, and classes of glyphs behind an extension.
Bytes makePositions()
{
    const Bytes listed =
        join({bigs({2, 0, 1, 8}), bigs({1, 12, 4, 0, 1, 18}), bigs({1, 1, 1}), bigs({1, 2, -50})});
    const Bytes classes = join({bigs({2, 32, 5, 0, 42, 50, 2, 2}), bigs({0, 0, 0, 0, 0, 0, 0, -30}),
                                bigs({2, 1, 2, 2, 0}), bigs({1, 2, 1, 1}), bigs({2, 1, 1, 1, 1})});
    const Bytes extended = join({bigs({9, 0, 1, 8}), bigs({1, 2}), big(8), classes});
    const Bytes features = join({bigs({1}), toBytes("kern"), bigs({8}), bigs({0, 2, 0, 1})});
    const int lookups = 10 + int(features.size());
    return join(
        {bigs({1, 0, 0, 10, lookups}), features, bigs({2, 6, 6 + int(listed.size())}), listed, extended});
}

using Tables = std::vector<std::pair<const char*, Bytes>>;

/// The tables that every font here has. Two glyphs have a width of their own.
Tables makeCommonTables(int mapFormat, int glyphCount)
{
    Bytes head(54), hhea(36);
    const auto put = [](Bytes& table, size_t at, int value)
    {
        table[at] = uint8_t(value >> 8);
        table[at + 1] = uint8_t(value);
    };
    put(head, 18, 1000); // units of the em square
    put(hhea, 4, 800);
    put(hhea, 6, -200);
    put(hhea, 34, 2); // glyphs with a width of their own
    const int platform = mapFormat == 12 ? 10 : 1;
    return {
        {"cmap", join({bigs({0, 1, 3, platform}), big(12), makeCharacterMap(mapFormat)})},
        {"head", head},
        {"hhea", hhea},
        {"hmtx", join({bigs({500, 0, 550, 0}), Bytes(size_t(glyphCount - 2) * 2)})},
        {"maxp", join({big(0x00010000), bigs({glyphCount})})},
    };
}

/// @param start  of the font in its file.
Bytes assembleFont(const Bytes& kind, const Tables& tables, uint32_t start = 0)
{
    Bytes directory = join({kind, bigs({int(tables.size()), 0, 0, 0})});
    Bytes data;
    for (const auto& [tag, table] : tables)
    {
        const uint32_t offset = start + uint32_t(12 + 16 * tables.size() + data.size());
        directory = join({directory, toBytes(tag), big(0), big(offset), big(uint32_t(table.size()))});
        data = join({data, table});
    }
    return join({directory, data});
}

/// A TrueType font: a triangle, a shape with curves, and one composed of both.
/// @param more   further tables.
/// @param start  of the font in its file.
Bytes makeFont(int mapFormat, const Tables& more = {}, uint32_t start = 0)
{
    const Bytes triangle =
        join({bigs({1, 0, 0, 500, 700, 2, 0}), {1, 1, 1}, bigs({0, 500, -250, 0, 0, 700}), {0}});
    const Bytes curves = join({bigs({1, 0, -100, 255, 200, 3, 0}),
                               {0x09, 1, 0x26, 0x30},
                               bigs({0, 200}),
                               {55},
                               bigs({0, -100}),
                               {100}});
    const Bytes both =
        join({bigs({-1, 0, -100, 600, 720, 0x2a, 1}), {10, 20}, bigs({0x3000, 0x03, 2, 300, -40})});
    const int first = int(triangle.size()), second = int(curves.size()), third = int(both.size());

    Tables tables = makeCommonTables(mapFormat, 4);
    tables.push_back({"glyf", join({triangle, curves, both})});
    tables.push_back({"loca", bigs({0, 0, first / 2, (first + second) / 2, (first + second + third) / 2})});
    tables.insert(tables.end(), more.begin(), more.end());
    return assembleFont(big(0x00010000), tables, start);
}

// --- Outlines in PostScript form -----------------------------------------------------------------------------

Bytes makeIndex(const std::vector<Bytes>& items)
{
    if (items.empty())
        return bigs({0});
    Bytes list = join({bigs({int(items.size())}), {2}, bigs({1})});
    int end = 1;
    for (const Bytes& item : items)
        list = join({list, bigs({end += int(item.size())})});
    return join({list, join(items)});
}

/// An entry of a dictionary: numbers and their operator. Its size does not depend on the numbers.
Bytes makeEntry(const std::vector<size_t>& values, const Bytes& command)
{
    Bytes entry;
    for (const size_t value : values)
        entry = join({entry, {29}, big(uint32_t(value))});
    return join({entry, command});
}

struct PostScript
{
    std::vector<Bytes> programs; ///< of glyphs
    std::vector<Bytes> global;   ///< subroutines; the first has the number -107
    std::vector<Bytes> local;
    /// Which of two parts of the font each glyph belongs to; only the second has the local subroutines. Empty: the font
    /// has no parts.
    Bytes selection;
};

/// The table "CFF ".
Bytes makeOutlines(const PostScript& font)
{
    const bool isInParts = !font.selection.empty();
    const Bytes ownEntries = makeEntry({10}, {20}); // a width; the subroutines follow
    const Bytes own = join({ownEntries, makeEntry({ownEntries.size() + 6}, {19}), makeIndex(font.local)});
    const size_t ownSize = ownEntries.size() + 6;
    const size_t topSize = isInParts ? 17 + 6 + 7 + 7 + 7 : 6 + 11;

    const Bytes header = {1, 0, 4, 2};
    const Bytes name = makeIndex({toBytes("A")});
    const Bytes behindTop = join({makeIndex({}), makeIndex(font.global)});
    const size_t programsAt =
        header.size() + name.size() + makeIndex({Bytes(topSize)}).size() + behindTop.size();
    const Bytes programs = makeIndex(font.programs);
    const size_t ownAt = programsAt + programs.size();
    const size_t selectionAt = ownAt + own.size();
    const size_t partsAt = selectionAt + font.selection.size();

    const Bytes ownEntry = makeEntry({ownSize, ownAt}, {18});
    Bytes top = makeEntry({programsAt}, {17});
    if (isInParts)
        top = join({makeEntry({0, 0, 0}, {12, 30}), top, makeEntry({2}, {12, 6}),
                    makeEntry({selectionAt}, {12, 37}), makeEntry({partsAt}, {12, 36})});
    else
        top = join({top, ownEntry});
    const Bytes parts =
        isInParts ? makeIndex({makeEntry({ownEntries.size(), ownAt}, {18}), ownEntry}) : Bytes();
    return join({header, name, makeIndex({top}), behindTop, programs, own, font.selection, parts});
}

Bytes makePostScriptFont(const PostScript& font)
{
    Tables tables = makeCommonTables(4, int(font.programs.size()));
    tables.push_back({"CFF ", makeOutlines(font)});
    return assembleFont(toBytes("OTTO"), tables);
}

constexpr uint8_t FIRST_SUBROUTINE = 139 - 107; ///< as a number in a program
constexpr uint8_t CALL_LOCAL = 10, CALL_GLOBAL = 29, RETURN = 11, END = 14;

/// A number in a program.
Bytes number(int value)
{
    return join({{28}, bigs({value})});
}

Bytes numbers(const std::vector<int>& values, const Bytes& command)
{
    Bytes bytes;
    for (const int value : values)
        bytes = join({bytes, number(value)});
    return join({bytes, command});
}

/// Uses every drawing command, hints with masks, and both kinds of subroutines.
PostScript makeDrawing()
{
    PostScript font;
    const Bytes move = numbers({500, 10, 20}, {21}); // a width in front
    const Bytes lines =
        join({numbers({400, 0, -100, 300}, {5}), numbers({-90, 80, -70}, {6}), numbers({9, 8}, {7})});
    const Bytes curves = join({numbers({10, 0, 90, 50, 0, 100}, {8}), numbers({5, 50, 60, 70, 8}, {31}),
                               numbers({50, 60, 70, 8}, {30}), numbers({3, 50, 60, 70, 80}, {27}),
                               numbers({50, 60, 70, 80}, {26}), numbers({1, 2, 3, 4, 5, 6, 7, 8}, {24}),
                               numbers({1, 2, 3, 4, 5, 6, 7, 8}, {25})});
    const Bytes flexes = join({numbers({9, 8, 7, 6, 5, 4, 3}, {12, 34}),
                               numbers({9, 8, 7, 6, 5, 4, 3, 2, 1, 2, 3, 4, 50}, {12, 35}),
                               numbers({90, 80, 70, 60, 50, 40, 30, 80, 10}, {12, 36}),
                               numbers({9, 8, 7, 6, 5, 4, 3, 2, 1, 2, 3}, {12, 37})});
    const Bytes hints = join({numbers({0, 20}, {18}), numbers({0, 20, 30, 20}, {19, 0xE0})});
    const Bytes fraction = {255, 0, 100, 128, 0, 22};
    font.programs = {
        {END},
        join({hints, move, lines, {END}}),
        join({move, {FIRST_SUBROUTINE, CALL_GLOBAL, END}}),
        join({numbers({10}, {4}), fraction, {FIRST_SUBROUTINE, CALL_LOCAL}, flexes}),
        join({move, numbers({0, 300, 400, 150, -400, 150}, {8, END})})}; // its curve reaches beyond its ends
    font.global = {join({curves, {RETURN}})};
    font.local = {join({{FIRST_SUBROUTINE, CALL_GLOBAL}, lines})};
    return font;
}

/// Subroutines that each call the next one 40 times.
/// @param last  the subroutine that the last of them calls.
std::vector<Bytes> makeNest(int depth, const Bytes& last)
{
    std::vector<Bytes> subroutines;
    for (int i = 1; i <= depth; ++i)
    {
        Bytes calls;
        for (int j = 0; j < 40; ++j)
            calls = join({calls, {uint8_t(FIRST_SUBROUTINE + i), CALL_GLOBAL}});
        subroutines.push_back(calls);
    }
    subroutines.push_back(last);
    return subroutines;
}

} // namespace

void addFonts(std::vector<Seed>& seeds)
{
    for (const int format : {0, 4, 6, 12})
        seeds.push_back({"font", "map" + std::to_string(format), makeFont(format), "", true});
    seeds.push_back({"font", "kern", makeFont(4, {{"kern", makeKerning()}}), "", true});
    seeds.push_back({"font", "gpos", makeFont(4, {{"GPOS", makePositions()}}), "", true});
    seeds.push_back({"font", "collection",
                     join({toBytes("ttcf"), big(0x00010000), big(1), big(16), makeFont(12, {}, 16)}),
                     "Error reading Font \"file.ttf\"", true});
    seeds.push_back({"font", "none", {}, "Error reading Font \"file.ttf\"", false});

    PostScript drawing = makeDrawing();
    const char* const OTHER_KIND = "Error reading Font \"file.ttf\""; // Font refuses it, FontFace accepts it
    const auto add = [&](const char* name) {
        seeds.push_back({"font", name, makePostScriptFont(drawing), OTHER_KIND, true});
    };
    add("postscript");
    drawing.selection = {0, 0, 0, 0, 1, 1}; // a part for each glyph
    add("postscriptparts");
    drawing.selection = join({{3}, bigs({2, 0}), {0}, bigs({3}), {1}, bigs({5})});
    add("postscriptranges");
}

void addCostlyFonts(std::vector<Seed>& files)
{
    const auto add = [&](const char* name, int depth, const Bytes& last)
    {
        PostScript font;
        font.programs.assign(96, join({numbers({1, 2}, {21}), {FIRST_SUBROUTINE, CALL_GLOBAL}}));
        font.global = makeNest(depth, last);
        files.push_back({"font", name, makePostScriptFont(font), "Error reading Font \"file.ttf\"", true});
    };
    const Bytes lines = numbers({10, 10, -10, -10}, {6, RETURN});
    add("subroutines that do nothing", 9, {RETURN});
    add("subroutines that draw", 9, lines);
    add("subroutines that draw as much as allowed", 2, lines);
    add("subroutines that draw far", 2,
        numbers({500, 700, 0, -700, 500, 0, -500, 700, -500, -700, 0, 0}, {8, RETURN}));
}

} // namespace hostile
