#include "orv/textlayout.h"

#include "scenetest.h"

#include "orv/fontcache.h"
#include "orv/renderdevice.h"
#include "orv/text.h"
#include "support/allocation.h"

#include <ft2build.h>
#include FT_FREETYPE_H

#include <algorithm>
#include <cmath>
#include <cstdlib>
#include <list>
#include <random>
#include <string>
#include <utility>

using namespace orv;
using support::LogCapture;
using support::Picture;

namespace
{

const char* const SANS = "dejavu/DejaVuSans.ttf";
const char* const CHINESE = "droid/DroidSansFallbackFull.ttf";

std::string toUtf8(uint32_t c)
{
    if (c < 0x80)
        return {char(c)};
    const auto follower = [c](int shift) { return char(0x80 | (c >> shift & 0x3F)); };
    if (c < 0x800)
        return {char(0xC0 | c >> 6), follower(0)};
    if (c < 0x10000)
        return {char(0xE0 | c >> 12), follower(6), follower(0)};
    return {char(0xF0 | c >> 18), follower(12), follower(6), follower(0)};
}

class TextLayoutTest : public SceneTest
{
protected:
    void SetUp() override
    {
        SceneTest::SetUp();
        registerSource(*pool, "/usr/share/fonts/truetype", false);
        sans = FontFace::load(*pool, SANS);
        chinese = FontFace::load(*pool, CHINESE);
        ASSERT_TRUE(sans && chinese);
    }

    GlyphCache::Ptr makeCache(unsigned pageSize = 512, unsigned mostPages = 8)
    {
        const auto cache = makeShared<GlyphCache>(*pool, GlyphCacheOptions{pageSize, mostPages});
        cache->addFont(sans);
        cache->addFont(chinese);
        return cache;
    }

    TextLayout::Ptr makeText(const GlyphCache::Ptr& cache)
    {
        return makeShared<TextLayout>(*pool, cache, Colour4f::WHITE);
    }

    Picture drawText(TextLayout& text)
    {
        Background(Colour4f::BLACK).enable(*renderContext);
        text.draw(*renderContext);
        return support::readFrame();
    }

    Picture drawString(const GlyphCache::Ptr& cache, const char* utf8, float size = 20.0f, float x = 1.0f,
                       float y = 1.0f)
    {
        const auto text = makeText(cache);
        text->add(utf8, size, x, y);
        return drawText(*text);
    }

    FontFace::Ptr sans, chinese;
};

bool isBlack(const Picture& picture)
{
    for (int y = 0; y < picture.height; ++y)
        for (int x = 0; x < picture.width; ++x)
            if (!support::isNear(picture.pixel(x, y), BLACK, 0))
                return false;
    return true;
}

} // namespace

// Faults caught: another size, place or baseline than the engine's other text; a glyph cut off or next to its texels.
TEST_F(TextLayoutTest, looksAsTextDoes)
{
    const auto cache = makeCache();
    for (const unsigned size : {9u, 16u, 23u, 40u})
    {
        const Font::Ptr font = get(*pool->getFontCache(), SANS, size);
        for (const char* string : {"!", "gj", "Qy", "m", "@", "{|}"})
        {
            const auto text = makeShared<Text>(*pool, font, Colour4f::WHITE);
            text->add(string, 3.0f, 2.0f);
            Background(Colour4f::BLACK).enable(*renderContext);
            text->draw(*renderContext);
            const Picture expected = support::readFrame();
            EXPECT_TRUE(comparePictures("text", expected, drawString(cache, string, float(size), 3, 2)))
                << string << size;
            const auto layout = makeText(cache);
            EXPECT_EQ(Text::getLineHeight(*font), layout->getLineHeight(float(size)));
            EXPECT_EQ(Text::measure(*font, "!\n!").y, layout->measure("!\n!", float(size)).y);
            EXPECT_NEAR(Text::measure(*font, "m").x, layout->measure("m", float(size)).x, 0.001f);
        }
    }
}

// Faults caught: bytes that end the string or swallow what follows; marks that show; lines, alignment and kerning left out.
TEST_F(TextLayoutTest, readsUtf8AndLines)
{
    const auto cache = makeCache();
    const struct
    {
        const char* string;
        const char* same; ///< looks like
    } cases[] = {
        {"a\xFF"
         "b",
         "a\xEF\xBF\xBD"
         "b"},
        {"\xE4\xB8"
         "A\xC3",
         "\xEF\xBF\xBD"
         "A\xEF\xBF\xBD"},
        {"a\x01\x7F\xC2\x85\tb", "ab"},
        {"a\xE2\x80\x8D\xEF\xB8\x8F\xC2\xAD\xE2\x80\xAE\xEF\xBB\xBF\xF3\xA0\x84\x80"
         "b",
         "ab"}, // joiner, selectors, soft hyphen, direction, byte order mark
        {"a\n\nb", "a\n\nb"},
    };
    for (const auto& test : cases)
        EXPECT_TRUE(
            comparePictures("utf8", drawString(cache, test.same, 16), drawString(cache, test.string, 16)))
            << test.same;

    const auto text = makeText(cache);
    const float a = text->measure("A", 40).x, v = text->measure("V", 40).x, both = text->measure("AV", 40).x;
    const float em = 40.0f / float(sans->getAscent() + sans->getDescent());
    EXPECT_NEAR(a + v + em * float(sans->getKerning(sans->findGlyph('A'), sans->findGlyph('V'))), both,
                0.001f);
    EXPECT_LT(both, a + v - 1.0f);
    EXPECT_EQ(text->measure("\n", 20).y, text->measure("x", 20).y + text->getLineHeight(20));
    EXPECT_EQ(0.0f, text->measure("", 20).y);

    for (const auto alignment : {TextLayout::Alignment::CENTRE, TextLayout::Alignment::RIGHT})
    {
        const float part = alignment == TextLayout::Alignment::RIGHT ? 1.0f : 0.5f;
        const auto expected = makeText(cache), aligned = makeText(cache);
        expected->add("iii", 16, 60.0f - part * text->measure("iii", 16).x, 2);
        expected->add("WW", 16, 60.0f - part * text->measure("WW", 16).x, 2 + text->getLineHeight(16));
        aligned->add("iii\nWW", 16, 60, 2, alignment);
        EXPECT_TRUE(comparePictures("aligned", drawText(*expected), drawText(*aligned)));
    }
}

// Faults caught: glyphs that are scaled instead of drawn for the display; places or sizes that do not follow.
TEST_F(TextLayoutTest, densityMakesUnitsLarger)
{
    const auto cache = makeCache();
    for (const float density : {1.5f, 2.0f, 2.625f})
    {
        const auto text = makeText(cache), wanted = makeText(cache);
        text->add("aé世", 12, 4, 2);
        drawText(*text); // has been drawn at another density
        text->setDensity(density);
        wanted->add("aé世", 12 * density, 4 * density, 2 * density);
        const Picture expected = drawText(*wanted);
        EXPECT_FALSE(isBlack(expected));
        EXPECT_TRUE(comparePictures("density", expected, drawText(*text))) << density;
        EXPECT_NEAR(wanted->measure("aé\n世", 12 * density).x, text->measure("aé\n世", 12).x * density,
                    0.001f);
        EXPECT_NEAR(wanted->getLineHeight(12 * density), text->getLineHeight(12) * density, 0.001f);
    }
    LogCapture log;
    const auto text = makeText(cache);
    text->setDensity(0.0f);
    text->setDensity(NAN);
    text->add("x", -1, 0, 0);
    text->add("x", NAN, 0, 0);
    text->add("x", 5000, 0, 0);
    EXPECT_EQ(5, log.count('E'));
    EXPECT_EQ(1.0f, text->getDensity());
    EXPECT_TRUE(isBlack(drawText(*text)));
}

// Faults caught: a character that is nowhere draws nothing or ends the line, a log that says so in each frame; a fallback
// font that is not asked, or that is drawn at the size of its own lines.
TEST_F(TextLayoutTest, showsABoxForWhatNoFontHas)
{
    const auto cache = makeCache();
    const std::string missing = toUtf8(0x1F9FF), other = toUtf8(0xF0000);
    LogCapture log;
    const TextLayout::Glyph box = {0, 0, 0, 0};
    const auto expected = makeText(cache);
    expected->addGlyphs(&box, 1, 20, 1, 1 + expected->getAscent(20));
    const Picture picture = drawText(*expected);
    EXPECT_FALSE(isBlack(picture));
    EXPECT_TRUE(comparePictures("box", picture, drawString(cache, missing.c_str())));
    EXPECT_EQ(1, log.count('W'));
    for (int i = 0; i < 3; ++i)
        drawString(cache, (missing + other).c_str(), 30);
    EXPECT_EQ(2, log.count('W')) << log.text();
    EXPECT_NE(std::string::npos, log.text().find("U+1F9FF"));

    EXPECT_EQ(0u, cache->findFont('a'));
    EXPECT_EQ(1u, cache->findFont(0x4E16));
    EXPECT_EQ(2u, cache->findFont(0x1F9FF));
    const auto text = makeText(cache);
    const float em = 20.0f * float(sans->getUnitsPerEm()) / float(sans->getAscent() + sans->getDescent());
    EXPECT_NEAR(em, text->measure("世", 20).x, 0.05f); // an ideograph is one em wide

    // A font without a picture for it: a plain box.
    const auto lone = makeShared<GlyphCache>(*pool);
    EXPECT_TRUE(isBlack(drawString(lone, "x"))) << "no fonts";
    EXPECT_FALSE(lone->addFont(nullptr));
    const TextLayout::Glyph wrong[] = {{2, 1, 0, 0}, {0, 70000, 0, 0}};
    text->addGlyphs(wrong, 2, 20, 0, 0);
    EXPECT_TRUE(isBlack(drawText(*text)));
    EXPECT_EQ(2, log.count('E')) << log.text();
}

// Faults caught: a glyph that is overwritten while it is drawn, one that comes from where another was, a bound that does
// not hold. The same random texts with little room and with plenty.
TEST_F(TextLayoutTest, forgettingGlyphsIsNotSeen)
{
    const auto plenty = makeCache(1024, 64);
    std::mt19937 random(7);
    for (const auto& [side, pages] : {std::pair(64u, 1u), std::pair(64u, 3u), std::pair(128u, 2u)})
    {
        const auto little = makeCache(side, pages);
        const auto kept = makeText(little), keptWanted = makeText(plenty);
        for (const auto& text : {kept, keptWanted})
            text->add("kept 永", 11, 1, 50);
        for (int round = 0; round < 60; ++round)
        {
            const auto text = makeText(little), wanted = makeText(plenty);
            const int strings = 1 + int(random() % 4);
            for (int i = 0; i < strings; ++i)
            {
                std::string string;
                for (unsigned left = random() % 12; left > 0; --left)
                    string += toUtf8(random() % 2 ? 0x21 + random() % 500 : 0x4E00 + random() % 200);
                const auto size = float(8 + random() % 24);
                const auto x = float(random() % 40), y = float(random() % 40);
                for (const auto& t : {text, wanted})
                    t->add(string.c_str(), size, x, y);
            }
            Background(Colour4f::BLACK).enable(*renderContext);
            wanted->draw(*renderContext);
            keptWanted->draw(*renderContext);
            const Picture expected = support::readFrame();
            Background(Colour4f::BLACK).enable(*renderContext);
            text->draw(*renderContext);
            kept->draw(*renderContext);
            // Glyphs that cover each other may be blended in another order.
            ASSERT_TRUE(comparePictures("forgotten", expected, support::readFrame(), {3, 0})) << round;
            ASSERT_GE(pages, little->getPageCount());
        }
        EXPECT_LT(little->getGlyphCount(), little->getDrawnCount()) << "nothing was forgotten";
    }
}

// Fault caught: glyphs dropped that are not the least recently used. Compared with a list.
TEST_F(TextLayoutTest, forgetsWhatWasUsedTheLongestAgo)
{
    const auto cache = makeCache(64, 2);
    const size_t ROOM = 2 * 4 * 4; // cells of 16 pixels
    std::list<uint32_t> model;
    uint64_t drawn = 0;
    std::mt19937 random(3);
    for (int round = 0; round < 2000; ++round)
    {
        // Ideographs of 10 to 15 pixels; a few of them often.
        const uint32_t c = 0x5010 + random() % (random() % 2 ? 12 : 60);
        drawString(cache, toUtf8(c).c_str(), 15.0f);
        const auto found = std::find(model.begin(), model.end(), c);
        if (found != model.end())
            model.erase(found);
        else
            ++drawn;
        model.push_front(c);
        if (model.size() > ROOM)
            model.pop_back();
        ASSERT_EQ(drawn, cache->getDrawnCount()) << round;
        ASSERT_EQ(model.size(), cache->getGlyphCount());
    }
    EXPECT_LT(500u, drawn);
    EXPECT_EQ(2u, cache->getPageCount());
}

namespace
{

struct InkedGlyph
{
    unsigned number;
    float left; ///< how far it begins to the left of the pen, in ems
};

/// The glyphs of a font that characters have and that are not blank, by FreeType.
std::vector<InkedGlyph> findInkedGlyphs(const std::string& path, unsigned index)
{
    FT_Library library = nullptr;
    FT_Face face = nullptr;
    FT_Init_FreeType(&library);
    EXPECT_EQ(0, FT_New_Face(library, path.c_str(), FT_Long(index), &face));
    std::vector<InkedGlyph> glyphs;
    FT_UInt glyph = 0;
    for (FT_ULong c = FT_Get_First_Char(face, &glyph); glyph != 0; c = FT_Get_Next_Char(face, c, &glyph))
    {
        FT_Load_Glyph(face, glyph, FT_LOAD_NO_SCALE);
        if (face->glyph->outline.n_points > 0)
            glyphs.push_back({glyph, std::max(0.0f, -float(face->glyph->metrics.horiBearingX) /
                                                        float(face->units_per_EM))});
    }
    FT_Done_FreeType(library);
    std::sort(glyphs.begin(), glyphs.end(), [](const auto& a, const auto& b) { return a.number < b.number; });
    glyphs.erase(std::unique(glyphs.begin(), glyphs.end(),
                             [](const auto& a, const auto& b) { return a.number == b.number; }),
                 glyphs.end());
    return glyphs;
}

} // namespace

// Fault caught: a character of the font that is not drawn, or drawn as a box, when very many have been. "./run sweep" goes
// through larger fonts, whose outlines are in PostScript form, too.
TEST_F(TextLayoutTest, drawsTwentyThousandGlyphs)
{
    std::vector<std::pair<std::string, unsigned>> fonts = {{std::string("truetype/") + CHINESE, 0}};
    if (std::getenv("ORV_SWEEP_ALL"))
        fonts.insert(fonts.end(), {{"opentype/noto/NotoSansCJK-Regular.ttc", 2},
                                   {"opentype/noto/NotoSerifCJK-Bold.ttc", 0}});
    registerSource(*pool, "/usr/share/fonts", false);
    for (const auto& [name, index] : fonts)
    {
        const std::vector<InkedGlyph> glyphs = findInkedGlyphs("/usr/share/fonts/" + name, index);
        ASSERT_LT(20000u, glyphs.size()) << name;
        LogCapture log;
        const auto cache = makeShared<GlyphCache>(*pool, GlyphCacheOptions{256, 2});
        ASSERT_TRUE(cache->addFont(FontFace::load(*pool, name.c_str(), index))) << name;
        int shown = 0;
        for (size_t first = 0; first < glyphs.size(); first += 16)
        {
            const auto text = makeText(cache);
            const size_t count = std::min<size_t>(16, glyphs.size() - first);
            for (size_t i = 0; i < count; ++i)
            {
                const InkedGlyph& inked = glyphs[first + i];
                const TextLayout::Glyph glyph = {0, inked.number, (float(i % 4) + inked.left) * 16.0f + 2.0f,
                                                 float(i / 4) * 16.0f + 13.0f};
                text->addGlyphs(&glyph, 1, 16, 0, 0);
            }
            const Picture picture = drawText(*text);
            for (size_t i = 0; i < count; ++i)
            {
                int ink = 0;
                for (int y = 0; y < 16; ++y)
                    for (int x = 0; x < 16; ++x)
                        ink += picture.pixel(int(i % 4) * 16 + x, int(i / 4) * 16 + y).r;
                shown += ink > 0 ? 1 : 0;
            }
        }
        EXPECT_EQ(int(glyphs.size()), shown) << name;
        EXPECT_EQ(glyphs.size(), cache->getDrawnCount()) << name;
        EXPECT_EQ(0, log.count('W') + log.count('E')) << name << ": " << log.text();
        EXPECT_EQ(2u, cache->getPageCount()) << name;
    }
}

// Faults caught: a draw for each glyph or string, uploads or memory for a text that stays; all of a page sent for a glyph.
TEST_F(TextLayoutTest, isOneDrawForEachPage)
{
    const auto cache = makeCache();
    const auto text = makeText(cache), second = makeText(cache);
    text->add("Grüße", 20, 0, 0);
    text->add("世界", 20, 0, 30);
    second->add("other", 20, 0, 0);
    drawText(*text);
    drawText(*second);
    for (int i = 0; i < 4; ++i) // the driver makes things of its own at the third
    {
        text->draw(*renderContext);
        text->setColour(Colour4f(1, 0, 0, 0));
    }

    glcalls::reset();
    const uint64_t allocations = support::countAllocations();
    for (int i = 0; i < 3; ++i)
    {
        text->draw(*renderContext);
        text->setColour(Colour4f(1, 0, 0, 0.1f * float(i)));
    }
    EXPECT_EQ(allocations, support::countAllocations());
    EXPECT_EQ(3u, glcalls::count(glDrawArrays));
    EXPECT_EQ(0u, glcalls::count(glBufferData) + glcalls::count(glTexImage2D) +
                      glcalls::count(glTexSubImage2D) + glcalls::count(glGenerateMipmap));

    int rows = 0;
    glcalls::replace(glTexSubImage2D,
                     [&rows](GLenum target, GLint level, GLint x, GLint y, GLsizei width, GLsizei height,
                             GLenum format, GLenum type, const void* pixels)
                     {
                         rows += height;
                         glcalls::real(glTexSubImage2D)(target, level, x, y, width, height, format, type,
                                                        pixels);
                     });
    text->add("new", 20, 30, 30);
    drawText(*text);
    EXPECT_EQ(1u, glcalls::count(glTexSubImage2D));
    EXPECT_GE(48, rows);

    text->clear();
    drawText(*text);
    EXPECT_EQ(4u, glcalls::count(glDrawArrays));

    // More glyphs than 16 bits have indices for.
    const std::string many(TextLayout::MAX_GLYPHS + 1, 'e');
    text->add(many.c_str(), 8, 0, 0);
    glcalls::resetCounts();
    drawText(*text);
    EXPECT_EQ(2u, glcalls::count(glDrawArrays));
}

// Faults caught: text in the scene mirrored or out of place; its glyphs forgotten, overwritten or without mipmaps.
TEST_F(TextLayoutTest, standsInTheScene)
{
    const auto cache = makeCache(64, 1);
    const auto text = makeText(cache);
    text->setDensity(2.0f);
    text->add("Ag\n世", 12, 3, 2);
    const Picture expected = drawText(*text);
    const SharedPtr<Solid> solid = text->createSolid(*pool);
    ASSERT_TRUE(solid);
    const float scale = 2.0f * 6.0f / 64.0f; // a unit is two pixels
    solid->setScale(Vector3f(scale, scale, scale));
    solid->setPosition(Vector3f(-3, 3, 0));
    solid->setParent(scene);
    addSquare(Vector3f(0, 0, -1), 9.0f, makePaint(Colour4f(0, 0, 0, 1)));
    text->setColour(Colour4f::RED); // too late for the solid
    renderFrame();
    EXPECT_TRUE(comparePictures("solid", expected, support::readFrame(), {3, 0}));

    solid->setScale(Vector3f(scale, scale, scale) * 0.4f);
    renderFrame();
    const Picture small = support::readFrame();
    for (int i = 0; i < 4; ++i) // there is no room for these besides
        drawString(cache, "全部文字都不同的長句子", float(14 + i));
    renderFrame();
    EXPECT_TRUE(comparePictures("kept", small, support::readFrame()));
    EXPECT_EQ(1u, cache->getPageCount());

    // More than the pages hold: further solids below it, and none without anything.
    const auto large = makeText(cache);
    large->setDensity(2.0f);
    for (int i = 0; i < 5; ++i)
        large->add("永東國", float(8 + i), 0, float(6 * i));
    const Picture wanted = drawText(*large);
    const SharedPtr<Solid> parts = large->createSolid(*pool);
    ASSERT_TRUE(parts);
    EXPECT_FALSE(parts->getChildren().empty());
    solid->setParent(nullptr);
    parts->setScale(Vector3f(scale, scale, scale));
    parts->setPosition(Vector3f(-3, 3, 0));
    parts->setParent(scene);
    renderFrame();
    EXPECT_TRUE(comparePictures("parts", wanted, support::readFrame(), {4, 0}));

    LogCapture log;
    text->clear();
    EXPECT_FALSE(text->createSolid(*pool));
    EXPECT_EQ(1, log.count('E'));
}

// Faults caught: a different frame after a lost context; GL calls for lost objects.
TEST_F(TextLayoutTest, comesBackAfterALostContext)
{
    Picture before;
    for (int i = 0; i < 2; ++i)
    {
        auto cache = makeCache(64, 2);
        auto text = makeText(cache);
        for (float size = 9; size < 16; size += 1.0f)
            text->add("Qué 世界", size, 0, (size - 9) * 8);
        const Picture picture = drawText(*text);
        if (i == 0)
            before = picture;
        else
            EXPECT_TRUE(comparePictures("after", before, picture));
        replaceContext();
        renderer = nullptr;
        pool->forgetContext();
        renderContext = makeShared<RenderContext>();
        text->add("x", 10, 0, 0); // forgotten to be dropped: draws nothing
        EXPECT_TRUE(isBlack(drawText(*text)));
    }
}

// Faults caught: a glyph that GL refused and that is never sent again; a message in each frame.
TEST_F(TextLayoutTest, survivesARefusingDriver)
{
    const auto wantedCache = makeCache(64, 2);
    const Picture expected = drawString(wantedCache, "ab世界");
    for (int call = 1; call < 40; ++call)
    {
        LogCapture log;
        const auto cache = makeCache(64, 2);
        const auto text = makeText(cache);
        text->add("ab", 20, 1, 1);
        if (call % 2)
            drawText(*text); // so that the pages are there
        text->clear();
        text->add("ab世界", 20, 1, 1);
        Background(Colour4f::BLACK).enable(*renderContext);
        glcalls::refuseCall(call / 2 + 1);
        text->draw(*renderContext);
        glcalls::refuseCall(0);
        const int errors = log.count('E');
        RenderDevice::getError(true);
        drawText(*text);
        drawText(*text);
        EXPECT_EQ(errors, log.count('E')) << log.text();
        renderContext = makeShared<RenderContext>(); // knows nothing of what was refused
        renderContext->setViewport(0, 0, 64, 64);
        text->clear();
        text->add("ab世界", 20, 1, 1);
        EXPECT_TRUE(comparePictures("refused", expected, drawText(*text))) << call;
    }
}
