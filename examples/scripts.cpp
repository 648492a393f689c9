// A page in eight scripts, with fonts of the packages fonts-dejavu-core and fonts-droid-fallback. Built with HarfBuzz
// (packages libharfbuzz-dev, fonts-lohit-deva), it shows three more scripts shaped by that library.
//
//   build/default/examples/scripts --out scripts.png [--density 2]

#include "headless/headless.h"
#include "headless/png.h"

#include <orv/fontface.h>
#include <orv/glyphcache.h>
#include <orv/orv.h>
#include <orv/textlayout.h>

#ifdef WITH_HARFBUZZ
#include <hb.h>
#endif

#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <string>
#include <vector>

using namespace orv;

namespace
{

constexpr float WIDTH = 640.0f; // units, as everything here: the picture has density times as many pixels
constexpr float HEIGHT = 510.0f;
constexpr float MARGIN = 20.0f;
constexpr float SECOND_COLUMN = 170.0f;
constexpr float ROW = 38.0f;
constexpr float SIZE = 26.0f;
const Colour4f PAPER(0.96f, 0.95f, 0.91f, 1.0f);
const Colour4f INK(0.1f, 0.12f, 0.2f, 1.0f);
const Colour4f GREY(0.45f, 0.45f, 0.5f, 1.0f);
const Colour4f RED_INK(0.7f, 0.1f, 0.1f, 1.0f);

const char* const FILES[] = {
    "dejavu/DejaVuSans.ttf",
    "droid/DroidSansFallbackFull.ttf",
#ifdef WITH_HARFBUZZ
    "lohit-devanagari/Lohit-Devanagari.ttf",
#endif
};

struct Line
{
    const char* script;
    const char* greeting;
};

constexpr Line LINES[] = {
    {"Latin", "Grüße aus Århus, cześć z Łodzi"},
    {"Greek", "Καλημέρα, κόσμε"},
    {"Cyrillic", "Добрый день, мир"},
    {"Armenian", "Բարև, աշխարհ"},
    {"Georgian", "გამარჯობა, მსოფლიო"},
    {"Han", "你好，世界"},
    {"Kana", "こんにちは、セカイ"},
    {"Tifinagh", "ⴰⵣⵓⵍ, ⴰⵎⴰⴹⴰⵍ"},
};

#ifdef WITH_HARFBUZZ

/// Lines of one script and direction each; split texts that mix them into such pieces first.
constexpr Line SHAPED_LINES[] = {
    {"Arabic", "مرحبا بالعالم"},
    {"Hebrew", "שלום, עולם"},
    {"Devanagari", "नमस्ते, दुनिया"},
};

// [cookbook
/// Shapes a line with one font of the cache. @param size  as TextLayout has it. @return glyphs from left to right.
std::vector<TextLayout::Glyph> shape(const GlyphCache& glyphs, unsigned font, const char* utf8, float size)
{
    const FontFace& face = *glyphs.getFont(font);
    const FontFace& first = *glyphs.getFont(0);
    const float em = size * float(first.getUnitsPerEm()) / float(first.getAscent() + first.getDescent());
    const float scale = em / float(face.getUnitsPerEm());

    hb_blob_t* const file =
        hb_blob_create(reinterpret_cast<const char*>(face.getData()), unsigned(face.getSizeInBytes()),
                       HB_MEMORY_MODE_READONLY, nullptr, nullptr);
    hb_face_t* const hbFace = hb_face_create(file, face.getIndex());
    hb_font_t* const hbFont = hb_font_create(hbFace); // counts in units of the font
    hb_buffer_t* const buffer = hb_buffer_create();
    hb_buffer_add_utf8(buffer, utf8, -1, 0, -1);
    hb_buffer_guess_segment_properties(buffer);
    hb_shape(hbFont, buffer, nullptr, 0);

    unsigned count = 0;
    const hb_glyph_info_t* const infos = hb_buffer_get_glyph_infos(buffer, &count);
    const hb_glyph_position_t* const positions = hb_buffer_get_glyph_positions(buffer, &count);
    std::vector<TextLayout::Glyph> shaped;
    float pen = 0.0f;
    for (unsigned i = 0; i < count; ++i)
    {
        shaped.push_back({font, infos[i].codepoint, pen + float(positions[i].x_offset) * scale,
                          -float(positions[i].y_offset) * scale});
        pen += float(positions[i].x_advance) * scale;
    }
    hb_buffer_destroy(buffer);
    hb_font_destroy(hbFont);
    hb_face_destroy(hbFace);
    hb_blob_destroy(file);
    return shaped;
}
// cookbook]

/// @param codePoint  one of the line's, by which its font is chosen.
void addShaped(TextLayout& text, const char* utf8, uint32_t codePoint, float y)
{
    const GlyphCache::Ptr& glyphs = text.getGlyphs();
    const unsigned font = glyphs->findFont(codePoint);
    if (font == glyphs->getFontCount())
        return;
    const std::vector<TextLayout::Glyph> shaped = shape(*glyphs, font, utf8, SIZE);
    text.addGlyphs(shaped.data(), shaped.size(), SIZE, SECOND_COLUMN, y + text.getAscent(SIZE));
}

#endif

/// The words in three colours, one text for each.
void writePage(TextLayout& title, TextLayout& names, TextLayout& greetings)
{
    float y = MARGIN;
    title.add("Hello, world", 34.0f, WIDTH * 0.5f, y, TextLayout::Alignment::CENTRE);
    y += title.getLineHeight(34.0f) + 8.0f;
    const auto addName = [&](const char* script)
    { names.add(script, 15.0f, MARGIN, y + greetings.getAscent(SIZE) - names.getAscent(15.0f)); };
    for (const Line& line : LINES)
    {
        addName(line.script);
        greetings.add(line.greeting, SIZE, SECOND_COLUMN, y);
        y += ROW;
    }
#ifdef WITH_HARFBUZZ
    const uint32_t letters[] = {0x0645, 0x05E9, 0x0928};
    for (std::size_t i = 0; i < std::size(SHAPED_LINES); ++i)
    {
        addName(SHAPED_LINES[i].script);
        addShaped(greetings, SHAPED_LINES[i].greeting, letters[i], y);
        y += ROW;
    }
#endif
}

bool draw(const SharedPtr<AssetCachePool>& pool, float density)
{
    const auto glyphs = makeShared<GlyphCache>(*pool);
    for (const char* file : FILES)
    {
        if (!glyphs->addFont(FontFace::load(*pool, file)))
            return false; // the log says why
    }
    const auto title = makeShared<TextLayout>(*pool, glyphs, RED_INK);
    const auto names = makeShared<TextLayout>(*pool, glyphs, GREY);
    const auto greetings = makeShared<TextLayout>(*pool, glyphs, INK);
    for (const TextLayout::Ptr& text : {title, names, greetings})
        text->setDensity(density);
    writePage(*title, *names, *greetings);

    const auto context = makeShared<RenderContext>();
    context->setViewport(0, 0, int(WIDTH * density), int(HEIGHT * density));
    Background(PAPER).enable(*context);
    for (const TextLayout::Ptr& text : {title, names, greetings})
        text->draw(*context);
    std::printf("glyphs: %u, pages: %u\n", glyphs->getGlyphCount(), glyphs->getPageCount());
    return true;
}

} // namespace

int main(int argc, char** argv)
{
    orv::setLogLevel(orv::LogLevel::WARNING);
    std::string out = "scripts.png";
    float density = 2.0f;
    for (int i = 1; i + 1 < argc; i += 2)
    {
        if (std::strcmp(argv[i], "--density") == 0)
            density = std::strtof(argv[i + 1], nullptr);
        else
            out = argv[i + 1];
    }
    if (!(density >= 0.5f && density <= 8.0f))
    {
        std::fprintf(stderr, "the density is 0.5 to 8\n");
        return 2;
    }

    headless::Options options;
    options.width = int(WIDTH * density);
    options.height = int(HEIGHT * density);
    std::string error;
    const auto gl = headless::Context::create(options, error);
    if (!gl)
    {
        std::fprintf(stderr, "no GL context: %s\n", error.c_str());
        return 1;
    }
    const auto pool = makeShared<AssetCachePool>();
    registerSource(*pool, "/usr/share/fonts/truetype", false);
    const bool isDrawn = draw(pool, density);
    pool->flush();
    pool->flush();
    if (!isDrawn || !headless::writePng(out, options.width, options.height, gl->readPixels().data(), error))
    {
        std::fprintf(stderr, "%s\n", error.c_str());
        return 1;
    }
    std::printf("wrote %s\n", out.c_str());
    return 0;
}
