#include "orv/fontface.h"

#include "orv/memorystream.h"
#include "support/logcapture.h"
#include "support/tempdir.h"

#include <ft2build.h>
#include FT_FREETYPE_H
#include FT_ADVANCES_H

#include <gtest/gtest.h>

#include <algorithm>
#include <string>
#include <vector>

using namespace orv;
using support::LogCapture;

namespace
{

using Bytes = std::vector<uint8_t>;

const std::string FONTS = "/usr/share/fonts/truetype/";
const char* const POST_SCRIPT = "../opentype/cantarell/Cantarell-Regular.otf";
const char* const SANS = "dejavu/DejaVuSans.ttf";
const char* const CHINESE = "droid/DroidSansFallbackFull.ttf";

Bytes readFont(const char* name)
{
    return support::readFile(FONTS + name);
}

FontFace::Ptr load(const Bytes& file, unsigned index = 0)
{
    MemoryStream stream(file.data(), int(file.size()));
    return FontFace::load(stream, "test", index);
}

/// FreeType's result for the same file.
class Judge
{
public:
    explicit Judge(const Bytes& file, unsigned index = 0)
    {
        FT_Init_FreeType(&m_library);
        EXPECT_EQ(0,
                  FT_New_Memory_Face(m_library, file.data(), FT_Long(file.size()), FT_Long(index), &m_face));
        FT_Select_Charmap(m_face, FT_ENCODING_UNICODE);
    }
    ~Judge() { FT_Done_FreeType(m_library); }
    Judge(const Judge&) = delete;
    Judge& operator=(const Judge&) = delete;

    FT_FaceRec& face() { return *m_face; }
    unsigned findGlyph(uint32_t c) { return FT_Get_Char_Index(m_face, c); }
    int getAdvance(unsigned glyph)
    {
        FT_Fixed advance = 0;
        return FT_Get_Advance(m_face, glyph, FT_LOAD_NO_SCALE, &advance) == 0 ? int(advance) : -1;
    }
    /// By the table "kern" alone.
    int getKerning(unsigned left, unsigned right)
    {
        FT_Vector kerning = {0, 0};
        FT_Get_Kerning(m_face, left, right, FT_KERNING_UNSCALED, &kerning);
        return int(kerning.x);
    }

private:
    FT_Library m_library = nullptr;
    FT_Face m_face = nullptr;
};

uint32_t read32(const Bytes& file, size_t at)
{
    return uint32_t(file.at(at)) << 24 | uint32_t(file.at(at + 1)) << 16 | uint32_t(file.at(at + 2)) << 8 |
           file.at(at + 3);
}

void write32(Bytes& file, size_t at, uint32_t value)
{
    for (size_t i = 0; i < 4; ++i)
        file.at(at + i) = uint8_t(value >> (24 - 8 * i));
}

/// @return the offset of a table's entry in the font's directory, 0 if there is none.
size_t findEntry(const Bytes& file, const std::string& tag)
{
    for (size_t at = 12; at < 12 + 16u * file.at(5); at += 16)
    {
        if (std::equal(tag.begin(), tag.end(), file.begin() + ptrdiff_t(at)))
            return at;
    }
    return 0;
}

Bytes withoutTable(Bytes file, const std::string& tag)
{
    const size_t entry = findEntry(file, tag);
    EXPECT_NE(0u, entry);
    file.at(entry) = '#';
    return file;
}

/// A collection of two fonts, one behind the other.
Bytes makeCollection(const Bytes& first, const Bytes& second)
{
    Bytes file(20);
    std::copy_n("ttcf", 4, file.begin());
    write32(file, 4, 0x00010000);
    write32(file, 8, 2);
    for (const Bytes* font : {&first, &second})
    {
        file.resize((file.size() + 3) & ~size_t(3));
        const size_t start = file.size();
        write32(file, font == &first ? 12 : 16, uint32_t(start));
        file.insert(file.end(), font->begin(), font->end());
        for (size_t at = start + 12; at < start + 12 + 16u * font->at(5); at += 16)
            write32(file, at + 8, read32(file, at + 8) + uint32_t(start));
    }
    return file;
}

/// Letters, and every 37th glyph of the font.
std::vector<unsigned> sampleGlyphs(const FontFace& face)
{
    std::vector<unsigned> glyphs;
    for (uint32_t c = 'A'; c <= 'z'; ++c)
        glyphs.push_back(face.findGlyph(c));
    for (unsigned glyph = 0; glyph < face.getGlyphCount(); glyph += 37)
        glyphs.push_back(glyph);
    return glyphs;
}

} // namespace

// Faults caught: characters beyond 16 bits, at the ends of segments or of a map that is not the first missing; advances of
// the glyphs that share the last one.
TEST(FontFace, hasEveryCharacterThatAnotherReaderFinds)
{
    for (const char* name : {SANS, "dejavu/DejaVuSansMono-Bold.ttf", CHINESE, POST_SCRIPT})
    {
        const Bytes file = readFont(name);
        const FontFace::Ptr face = load(file);
        ASSERT_TRUE(face) << name;
        Judge judge(file);
        EXPECT_EQ(judge.face().units_per_EM, face->getUnitsPerEm());
        EXPECT_EQ(judge.face().num_glyphs, long(face->getGlyphCount()));
        int found = 0, different = 0;
        for (uint32_t c = 0; c <= 0x110000; ++c)
        {
            const unsigned glyph = judge.findGlyph(c);
            found += glyph != 0 ? 1 : 0;
            different += glyph != face->findGlyph(c) ? 1 : 0;
        }
        EXPECT_EQ(0, different) << name;
        EXPECT_LT(name == CHINESE ? 20000 : name == POST_SCRIPT ? 800 : 3000, found) << name;

        int wide = 0;
        for (unsigned glyph = 0; glyph < face->getGlyphCount(); ++glyph)
            wide += judge.getAdvance(glyph) != face->getAdvance(glyph) ? 1 : 0;
        EXPECT_EQ(0, wide) << name;
        EXPECT_EQ(0, face->getAdvance(face->getGlyphCount()) + face->getAdvance(UINT32_MAX));
    }
}

// Faults caught: pairs missed or mixed up, in either table. The font has the same kerning in both.
TEST(FontFace, kernsAsTheTablesSay)
{
    const Bytes file = readFont(SANS);
    Judge judge(file);
    for (const Bytes& variant : {file, withoutTable(file, "GPOS"), withoutTable(file, "kern")})
    {
        const FontFace::Ptr face = load(variant);
        ASSERT_TRUE(face);
        const std::vector<unsigned> glyphs = sampleGlyphs(*face);
        int kerned = 0, different = 0;
        for (const unsigned left : glyphs)
        {
            for (const unsigned right : glyphs)
            {
                kerned += judge.getKerning(left, right) != 0 ? 1 : 0;
                different += judge.getKerning(left, right) != face->getKerning(left, right) ? 1 : 0;
            }
        }
        EXPECT_LT(50, kerned);
        EXPECT_EQ(0, different);
        EXPECT_GT(0, face->getKerning(face->findGlyph('A'), face->findGlyph('V')));
        EXPECT_EQ(0, face->getKerning(UINT32_MAX, 1) + face->getKerning(1, face->getGlyphCount()));
    }
    const FontFace::Ptr plain = load(withoutTable(withoutTable(file, "GPOS"), "kern"));
    EXPECT_EQ(0, plain->getKerning(plain->findGlyph('A'), plain->findGlyph('V')));
}

// Fault caught: tables of one font of a collection read for another.
TEST(FontFace, takesEachFontOfACollection)
{
    const Bytes file = makeCollection(readFont(SANS), readFont(POST_SCRIPT));
    for (unsigned index = 0; index < 2; ++index)
    {
        const FontFace::Ptr face = load(file, index);
        ASSERT_TRUE(face);
        Judge judge(file, index);
        for (uint32_t c = 0; c < 0x3000; ++c)
        {
            ASSERT_EQ(judge.findGlyph(c), face->findGlyph(c)) << index << " " << c;
            ASSERT_EQ(judge.getAdvance(judge.findGlyph(c)), face->getAdvance(face->findGlyph(c)));
        }
    }
    LogCapture log;
    EXPECT_FALSE(load(file, 2));
    EXPECT_FALSE(load(readFont(SANS), 1));
    EXPECT_EQ(2, log.count('E')) << log.text();
}

TEST(FontFace, refusesWhatItCannotRead)
{
    const Bytes sans = readFont(SANS);
    Bytes noOutlines = sans; // by its first word, it has PostScript outlines
    std::copy_n("OTTO", 4, noOutlines.begin());
    const Bytes outlines = readFont(POST_SCRIPT);
    const size_t outlinesEntry = findEntry(outlines, "CFF ");
    Bytes variable = outlines;
    variable.at(outlinesEntry + 3) = '2';
    Bytes noNames = outlines;
    noNames.at(read32(outlines, outlinesEntry + 8) + 4 + 2) = 9; // bytes of an offset
    Bytes old = outlines;
    const Bytes boxEntry = {0xFA, 0xDF, 0x05};
    const Bytes oldEntry = {0x8C, 0x0C, 0x06}; // programs of type 1
    std::copy(oldEntry.begin(), oldEntry.end(),
              std::search(old.begin(), old.end(), boxEntry.begin(), boxEntry.end()));
    Bytes noWidths = outlines;
    write32(noWidths, findEntry(noWidths, "hmtx") + 12, 0xFFFFFF);
    Bytes noUnit = sans;
    noUnit.at(read32(sans, findEntry(sans, "head") + 8) + 18) = 0xFF;
    Bytes noCharacters = sans;
    noCharacters.at(read32(sans, findEntry(sans, "cmap") + 8) + 3) = 0;
    const struct
    {
        Bytes file;
        const char* reason;
    } cases[] = {
        {{}, "it is no TrueType font"},
        {Bytes(1000, 0xA5), "it is no TrueType font"},
        {noOutlines, "a table is missing or reaches beyond the file"},
        {variable, "its outlines are in the form CFF2, of variable fonts"},
        {noNames, "its outlines in PostScript form (CFF) are damaged"},
        {old, "its outlines are PostScript programs of an old type"},
        {noWidths, "a table is missing or reaches beyond the file"},
        {withoutTable(sans, "hmtx"), "a table is missing or reaches beyond the file"},
        {Bytes(sans.begin(), sans.begin() + 100000), "a table is missing or reaches beyond the file"},
        {noUnit, "its unit of length is damaged"},
        {noCharacters, "it has no character map that can be read"},
    };
    for (const auto& test : cases)
    {
        LogCapture log;
        EXPECT_FALSE(load(test.file)) << test.reason;
        EXPECT_EQ(1, log.count('E')) << log.text();
        EXPECT_NE(std::string::npos, log.text().find(test.reason)) << log.text();
    }
}
