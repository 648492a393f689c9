#include "orv/font.h"

#include "orv/assetcachepool.h"
#include "orv/fontcache.h"
#include "orv/fontloader.h"
#include "orv/texture2d.h"
#include "orv/texture2dcache.h"
#include "support/tempdir.h"
#include "texturefixture.h"

#include <climits>
#include <map>
#include <numeric>

using namespace orv;
using imagefiles::Bytes;
using support::LogCapture;

namespace
{

class FontTest : public TextureFixture<FontCache>
{
protected:
    explicit FontTest(const SharedPtr<Texture2DCache>& made = makeShared<Texture2DCache>())
        : TextureFixture(makeShared<FontCache>(made))
        , textures(made)
    {
    }

    void flush() override
    {
        cache->flush();
        textures->flush();
    }

    /// Records the bitmaps given to GL.
    void keepAtlas()
    {
        glcalls::replace(glTexImage2D,
                         [this](GLenum target, GLint level, GLint inner, GLsizei width, GLsizei height,
                                GLint border, GLenum format, GLenum type, const void* pixels)
                         {
                             glcalls::real(glTexImage2D)(target, level, inner, width, height, border, format,
                                                         type, pixels);
                             EXPECT_EQ(GLenum(GL_ALPHA), format);
                             atlasWidth = width;
                             const auto* start = static_cast<const uint8_t*>(pixels);
                             atlas.assign(start, start + width * height);
                         });
    }

    /// The ink in a rectangle of the atlas.
    int sumOf(int x0, int y0, int x1, int y1) const
    {
        int sum = 0;
        for (int y = y0; y < y1; ++y)
            sum = std::accumulate(atlas.begin() + y * atlasWidth + x0, atlas.begin() + y * atlasWidth + x1,
                                  sum);
        return sum;
    }

    SharedPtr<Texture2DCache> textures;
    Bytes sans = support::readFile("/usr/share/fonts/truetype/dejavu/DejaVuSans.ttf");
    Bytes atlas;
    int atlasWidth = 0;
};

/// A number in big-endian bytes, at a place of a table.
struct Patch
{
    const char* tag; ///< "" for the file itself
    size_t at;
    int size;
    uint32_t value;
};

size_t read(const Bytes& file, size_t at, int size)
{
    size_t value = 0;
    for (int i = 0; i < size; ++i)
        value = value << 8 | file.at(at + size_t(i));
    return value;
}

size_t findTable(const Bytes& file, const std::string& tag)
{
    for (size_t entry = 12; entry < 12 + 16 * read(file, 4, 2); entry += 16)
    {
        if (std::equal(tag.begin(), tag.end(), file.begin() + ptrdiff_t(entry)))
            return read(file, entry + 8, 4);
    }
    ADD_FAILURE() << tag;
    return 0;
}

Bytes patched(Bytes file, const std::vector<Patch>& patches)
{
    for (const Patch& patch : patches)
    {
        const size_t at = (*patch.tag ? findTable(file, patch.tag) : 0) + patch.at;
        for (int i = 0; i < patch.size; ++i)
            file.at(at + size_t(i)) = uint8_t(patch.value >> 8 * (patch.size - 1 - i));
    }
    return file;
}

} // namespace

// Faults caught: names taken apart at another place, sizes half read, and sizes that end in asserts or huge atlases.
TEST_F(FontTest, loadsByFileAndSize)
{
    addFile("sans.ttf", sans);
    addFile("a b/\xC3\xA4$x.TTF", sans);
    addFile("orv#mine.ttf", sans);
    addFile("bare", sans);
    addFile("noise.ttf", Bytes(1000, 0xA5));
    const char* const INVALID = "Font name %s is invalid";
    const char* const ERROR = "Error reading Font \"%s\"";
    const struct
    {
        const char* name;
        const char* message; ///< empty: it loads
        const char* about;   ///< what the message names
    } cases[] = {
        {"sans.ttf;12", "", ""},
        {"a b/\xC3\xA4$x.TTF;12", "", ""},
        {"orv#mine.ttf;12", "", ""},
        {"bare;12", "", ""},
        {"sans.ttf", INVALID, "sans.ttf"},
        {"sans.ttf;", INVALID, "sans.ttf;"},
        {"sans.ttf;x", INVALID, "sans.ttf;x"},
        {"sans.ttf;12px", INVALID, "sans.ttf;12px"},
        {"sans.ttf; 12", INVALID, "sans.ttf; 12"},
        {"sans.ttf;12;12", INVALID, "sans.ttf;12;12"},
        {"sans.ttf;4294967308", INVALID, "sans.ttf;4294967308"},
        {"sans.ttf;0", ERROR, "sans.ttf"},
        {"sans.ttf;-12", INVALID, "sans.ttf;-12"},
        {"sans.ttf;650", ERROR, "sans.ttf"}, // glyphs wider than the atlas
        {"sans.ttf;2147483647", ERROR, "sans.ttf"},
        {"missing.ttf;12", ERROR, "missing.ttf"},
        {"noise.ttf;12", ERROR, "noise.ttf"},
        {";12", ERROR, ""},
    };
    for (const auto& test : cases)
    {
        LogCapture log;
        const Font::Ptr font = cache->get(test.name);
        EXPECT_EQ(!*test.message, bool(font)) << test.name;
        EXPECT_EQ(!*test.message, cache->exists(test.name));
        std::string message = test.message;
        if (font)
            EXPECT_EQ(12, font->getSize());
        else
            EXPECT_EQ(1, log.countMessage(message.replace(message.find("%s"), 2, test.about))) << log.text();
        EXPECT_EQ(font ? 0 : 1, log.count('E')) << log.text();
    }

    LogCapture log;
    EXPECT_TRUE(exists(*cache, "sans.ttf", 12) && exists(*cache, "orv:mine.ttf", 12));
    EXPECT_FALSE(exists(*cache, "sans.ttf", 13) || exists(*cache, nullptr, 12) || get(*cache, nullptr, 12));
    EXPECT_EQ(get(*cache, "sans.ttf", 12), cache->get("sans.ttf;12"));
    EXPECT_EQ(get(*cache, "sans.ttf", 12), cache->get("sans.ttf;012")) << "one size, one font";
    EXPECT_EQ(13, get(*cache, "sans.ttf", 13)->getSize());
    EXPECT_EQ(0, log.count('E'));

    FontLoader loader;
    for (const auto& [name, known] : std::map<const char*, bool>{
             {"a.ttf", true}, {"a.TtF;12", true}, {"a;b.ttf", false}, {"a.otf;1", false}, {"", false}})
        EXPECT_EQ(known, loader.isKnown(name)) << name;
}

// Faults caught: rectangles of another character, cut glyphs, rows packed into each other, an atlas too low.
TEST_F(FontTest, atlasHoldsEachGlyphByItself)
{
    addFile("sans.ttf", sans);
    // Computed by hand from the boxes in the file.
    for (const auto& [size, height] : std::map<int, int>{
             {1, 8}, {12, 32}, {16, 64}, {32, 128}, {40, 256}, {64, 512}, {100, 1024}, {300, 8192}})
    {
        keepAtlas();
        const Font::Ptr font = get(*cache, "sans.ttf", unsigned(size));
        ASSERT_TRUE(font) << size;
        EXPECT_EQ(512, atlasWidth);
        EXPECT_EQ(size_t(512 * height), atlas.size()) << size;
        EXPECT_EQ(unsigned(height), font->getTexture()->getHeight());
        EXPECT_NEAR(size, font->getAscent() + font->getDescent(), 0.01);
        EXPECT_GT(font->getDescent(), 0.0f);

        int ink = 0;
        for (int c = 32; c < 128; ++c)
        {
            const Font::CharacterData& data = font->getCharacterData(c);
            const int x0 = int(data.x0), y0 = int(data.y0), x1 = int(data.x1), y1 = int(data.y1);
            ASSERT_TRUE(x0 > 0 && y0 > 0 && x1 < 512 && y1 < height) << size << " " << c;
            const int own = sumOf(x0, y0, x1, y1);
            EXPECT_EQ(own, sumOf(x0 - 1, y0 - 1, x1 + 1, y1 + 1)) << size << " " << c;
            EXPECT_TRUE(c == ' ' || size < 12 || own > 0) << size << " " << c;
            EXPECT_TRUE(c == 127 || data.yoff >= -font->getAscent() - 1) << size << " " << c;
            ink += own;
        }
        EXPECT_EQ(ink, sumOf(0, 0, 512, height)) << size;

        // An M is wide, a full stop sits on the baseline, a g hangs below it.
        const auto at = [&font](char c) { return font->getCharacterData(c); };
        EXPECT_GE(at('M').xadvance, at('.').xadvance);
        EXPECT_EQ(0.0f, at('.').yoff + at('.').y1 - at('.').y0);
        EXPECT_TRUE(size < 12 || at('g').yoff + at('g').y1 - at('g').y0 > 1.0f);
        for (const int unknown : {31, 128, -1, INT_MIN, INT_MAX})
            EXPECT_EQ(0.0f, at(char(0)).xadvance + font->getCharacterData(unknown).x1);
        glcalls::restore(glTexImage2D);
    }
}

// Fault caught: an atlas too large for GL, detected only after it was made.
TEST_F(FontTest, refusesWhatTheGlCannotTake)
{
    addFile("sans.ttf", sans);
    for (const auto& [largest, size, loads] : std::vector<std::tuple<int, unsigned, bool>>{
             {512, 64, true}, {512, 100, false}, {256, 8, false}, {1023, 100, false}, {1024, 100, true}})
    {
        replaceInteger(GL_MAX_TEXTURE_SIZE, largest);
        LogCapture log;
        EXPECT_EQ(loads, bool(get(*cache, "sans.ttf", size))) << largest << " " << size;
        EXPECT_EQ(loads ? 0 : 1, log.countMessage("Error reading Font \"sans.ttf\""));
    }
    EXPECT_EQ(2u, glcalls::count(glGenTextures));
}

// Fault caught: a table that the rasteriser believes and follows out of the file, or for ever.
TEST_F(FontTest, refusesDamagedTables)
{
    // Places as DejaVu has them: the last map, which is the one used, and the A, two contours of 11 points.
    const size_t cmap = read(sans, findTable(sans, "cmap") + 4 + 8 * 4 + 4, 4);
    ASSERT_EQ(12u, read(sans, findTable(sans, "cmap") + cmap, 2));
    const size_t locaA = 4 * 36;
    const size_t glyph = read(sans, findTable(sans, "loca") + locaA, 4);
    ASSERT_EQ(2u, read(sans, findTable(sans, "glyf") + glyph, 2));
    const auto component = [glyph](uint32_t flags, uint32_t part, uint32_t offsets = 0)
    {
        return std::vector<Patch>{{"glyf", glyph, 2, 0xFFFF},
                                  {"glyf", glyph + 10, 4, flags << 16 | part},
                                  {"glyf", glyph + 14, 4, offsets}};
    };
    const struct
    {
        const char* reason;
        std::vector<Patch> patches;
    } cases[] = {
        {"PostScript form", {{"", 0, 4, 0x4F54544F}}},
        {"collection", {{"", 0, 4, 0x74746366}}},
        {"no TrueType font", {{"", 0, 4, 0x00020000}}},
        {"table is missing", {{"", 4, 2, 3}}},
        {"table is missing", {{"", 4, 2, 0xFFFF}}},
        {"table is missing", {{"", 12 + 16 * 6 + 8, 4, 0xFFFFFFF0}}}, // where cmap is
        {"header is damaged", {{"head", 50, 2, 2}}},
        {"no height", {{"hhea", 4, 2, 0x8000}}},
        {"no widths", {{"hhea", 34, 2, 0}}},
        {"widths are missing", {{"", 12 + 16 * 13 + 12, 4, 100}}}, // how long hmtx is
        {"character map refers to a missing glyph", {{"maxp", 4, 2, 30}}},
        {"character map is damaged", {{"cmap", cmap + 12, 4, 0x15555556}}}, // groups; their size wraps
        {"no character map", {{"cmap", cmap, 2, 2}}},
        {"no character map", {{"cmap", 2, 2, 0}}},
        {"outside of its table", {{"loca", locaA, 4, 0x00FFFFFF}}},
        {"outside of its table", {{"loca", locaA + 4, 4, 0}}},
        {"box is damaged", {{"glyf", glyph + 2, 2, 0x7FFF}}},
        {"out of its box", {{"glyf", glyph + 6, 4, 20 << 16 | 5}}},
        {"outline is damaged", {{"glyf", glyph, 2, 0x7FFF}}},
        {"outline is damaged", {{"glyf", glyph + 10, 4, 10 << 16 | 10}}}, // the ends of the contours
        {"outline is damaged", {{"glyf", glyph + 14, 2, 0xFFFF}}},        // bytes of instructions
        {"too many points", {{"glyf", glyph + 12, 2, 0xFFFE}}},
        // One point that is off the curve: from there the rasteriser looks at the next.
        {"outline is damaged",
         {{"glyf", glyph, 2, 1}, {"glyf", glyph + 10, 4, 0}, {"glyf", glyph + 14, 1, 0x30}}},
        {"nested too deeply", component(2, 36)},
        {"glyph refers to a missing one", component(2, 0xFFFF)},
        {"matching points", component(0, 40)},
        {"too far away", component(3, 40, 0x7FFF7FFF)},
        {"too large", {{"hhea", 4, 4, 1 << 16}}}, // a line is one unit high
    };
    int index = 0;
    for (const auto& test : cases)
    {
        const std::string name = std::to_string(index++) + ".ttf";
        addFile(name, patched(sans, test.patches));
        LogCapture log;
        EXPECT_FALSE(get(*cache, name.c_str(), 24)) << test.reason;
        EXPECT_EQ(1, log.countMessage("Error reading Font \"" + name + "\"")) << test.reason;
        EXPECT_TRUE(log.contains(test.reason)) << test.reason << "\n" << log.text();
    }
    EXPECT_EQ(0u, glcalls::count(glGenTextures));
}

// Fault caught: a pool whose fonts find no files, or whose flush leaves an atlas behind.
TEST_F(FontTest, poolLoadsAndFlushesFonts)
{
    const auto pool = makeShared<AssetCachePool>();
    registerSource(*pool, "/usr/share/fonts/truetype/dejavu", false);
    EXPECT_TRUE(pool->getFontCache()->get("DejaVuSans.ttf;12"));
    EXPECT_TRUE(pool->getFontCache()->getTexture2DCache() == pool->getTexture2DCache());
    pool->flush();
    EXPECT_EQ("", glcalls::describeLiveNames());
    EXPECT_FALSE(exists(*pool->getFontCache(), "DejaVuSans.ttf", 12));
}
