// The cost of text: glyphs a second laid out, and laid out and drawn, with GL calls dropped so that only the engine
// counts; and drawing an unchanged page. Then the same for a thousand different ideographs from a glyph cache, beside a
// program with a glyph table of its own. The best of several runs counts, since other work on the machine can only add
// time.

#include "glcalls/glcalls.h"
#include "headless/headless.h"

#include <orv/glyphcache.h>
#include <orv/orv.h>
#include <orv/textlayout.h>

#include <GLES2/gl2.h>

#include <algorithm>
#include <chrono>
#include <cmath>
#include <cstdio>
#include <string>
#include <unordered_map>
#include <vector>

using namespace orv;

namespace
{

constexpr int RUNS = 50;
constexpr int LINES = 100;
const char* const LINE = "The quick brown fox jumps over the lazy dog; 0123456789 times, they say.\n";

/// Seconds that one call takes, at best.
template <class Work>
double measure(const Work& work)
{
    using Clock = std::chrono::steady_clock;
    double best = HUGE_VAL;
    for (int i = 0; i < RUNS; ++i)
    {
        const Clock::time_point start = Clock::now();
        work();
        best = std::min(best, std::chrono::duration<double>(Clock::now() - start).count());
    }
    return best;
}

bool run(AssetCachePool& pool)
{
    const Font::Ptr font = get(*pool.getFontCache(), "DejaVuSans.ttf", 16);
    if (!font)
        return false;
    std::string page;
    for (int i = 0; i < LINES; ++i)
        page += LINE;
    const auto glyphs = double(std::count_if(page.begin(), page.end(), [](char c) { return c > ' '; }));

    const auto context = makeShared<RenderContext>();
    context->setViewport(0, 0, 1280, 720);
    Text text(pool, font, Colour4f::WHITE);
    const auto layOut = [&](Text::Alignment alignment)
    {
        text.clear();
        text.add(page.c_str(), 640.0f, 0.0f, alignment);
    };
    const double left = measure([&] { layOut(Text::Alignment::LEFT); });
    const double centred = measure([&] { layOut(Text::Alignment::CENTRE); });
    text.draw(*context); // links the program

    glcalls::dropAll();
    const double changed = measure(
        [&]
        {
            layOut(Text::Alignment::LEFT);
            text.draw(*context);
        });
    const double unchanged = measure([&] { text.draw(*context); });
    glcalls::dropAll(false);

    std::printf("a page of %.0f glyphs, millions of glyphs a second\n", glyphs);
    std::printf("  laid out                 %6.1f\n", glyphs / left * 1e-6);
    std::printf("  laid out, centred        %6.1f\n", glyphs / centred * 1e-6);
    std::printf("  laid out and drawn       %6.1f   (GL calls dropped)\n", glyphs / changed * 1e-6);
    std::printf("drawn again, unchanged     %6.2f microseconds\n", unchanged * 1e6);
    return true;
}

// --- A thousand ideographs -----------------------------------------------------------------------------------

constexpr uint32_t FIRST_IDEOGRAPH = 0x4E00;
constexpr int IDEOGRAPHS = 1000;
constexpr int COLUMNS = 50;

std::string makeIdeographs(uint32_t first)
{
    std::string text;
    for (uint32_t c = first; c < first + IDEOGRAPHS; ++c)
    {
        if (c > first && (c - first) % COLUMNS == 0)
            text += '\n';
        text += {char(0xE0 | c >> 12), char(0x80 | (c >> 6 & 0x3F)), char(0x80 | (c & 0x3F))};
    }
    return text;
}

/// Code for this page only: a table of glyphs, an array of corners, one draw.
class HandWritten
{
public:
    HandWritten()
    {
        for (uint32_t i = 0; i < IDEOGRAPHS; ++i)
            m_table[FIRST_IDEOGRAPH + i] = {
                float(i % 32) * 16.0f, float(i / 32) * 16.0f, 15.0f, 15.0f, 0.0f, -13.0f, 15.3f};
        for (unsigned i = 0; i < IDEOGRAPHS; ++i)
        {
            for (const unsigned corner : {0u, 2u, 1u, 1u, 2u, 3u})
                m_indices.push_back(static_cast<unsigned short>(4 * i + corner));
        }
    }

    void layOut(const std::string& text)
    {
        m_corners.clear();
        float x = 0.0f, y = 16.0f;
        for (std::size_t i = 0; i < text.size();)
        {
            if (text[i] == '\n')
            {
                x = 0.0f;
                y += 20.0f;
                ++i;
                continue;
            }
            const uint32_t c = uint32_t(text[i] & 0x0F) << 12 | uint32_t(text[i + 1] & 0x3F) << 6 |
                               uint32_t(text[i + 2] & 0x3F);
            i += 3;
            const Glyph& g = m_table.find(c)->second;
            const float left = std::floor(x + g.offsetX + 0.5f), top = y + g.offsetY;
            for (const auto& [dx, dy] : {std::pair(0.0f, 0.0f), std::pair(g.width, 0.0f),
                                         std::pair(0.0f, g.height), std::pair(g.width, g.height)})
                m_corners.insert(m_corners.end(),
                                 {left + dx, top + dy, (g.x + dx) / 512.0f, (g.y + dy) / 512.0f});
            x += g.advance;
        }
    }

    void draw() const
    {
        glUniform4f(0, 1.0f, 1.0f, 1.0f, 1.0f);
        glBindTexture(GL_TEXTURE_2D, 1);
        glVertexAttribPointer(0, 2, GL_FLOAT, GL_FALSE, 16, m_corners.data());
        glVertexAttribPointer(1, 2, GL_FLOAT, GL_FALSE, 16, m_corners.data() + 2);
        glDrawElements(GL_TRIANGLES, 6 * IDEOGRAPHS, GL_UNSIGNED_SHORT, m_indices.data());
    }

private:
    struct Glyph
    {
        float x, y, width, height, offsetX, offsetY, advance;
    };

    std::unordered_map<uint32_t, Glyph> m_table;
    std::vector<float> m_corners;
    std::vector<unsigned short> m_indices;
};

bool runIdeographs(AssetCachePool& pool)
{
    const auto cache = makeShared<GlyphCache>(pool, GlyphCacheOptions{1024, 8});
    for (const char* file : {"dejavu/DejaVuSans.ttf", "droid/DroidSansFallbackFull.ttf"})
    {
        if (!cache->addFont(FontFace::load(pool, file)))
            return false;
    }
    const auto context = makeShared<RenderContext>();
    context->setViewport(0, 0, 1280, 720);
    TextLayout text(pool, cache, Colour4f::WHITE);
    const std::string page = makeIdeographs(FIRST_IDEOGRAPH);
    const auto show = [&](const std::string& string)
    {
        text.clear();
        text.add(string.c_str(), 18.0f, 10.0f, 10.0f);
        text.draw(*context);
    };
    show(page);

    glcalls::dropAll();
    const double changed = measure([&] { show(page); });
    const double unchanged = measure([&] { text.draw(*context); });
    HandWritten byHand;
    const double changedByHand = measure(
        [&]
        {
            byHand.layOut(page);
            byHand.draw();
        });
    const double unchangedByHand = measure([&] { byHand.draw(); });
    glcalls::dropAll(false);

    uint32_t next = FIRST_IDEOGRAPH;
    double drawn = HUGE_VAL;
    for (int i = 0; i < 5; ++i)
    {
        const auto start = std::chrono::steady_clock::now();
        show(makeIdeographs(next += IDEOGRAPHS));
        drawn =
            std::min(drawn, std::chrono::duration<double>(std::chrono::steady_clock::now() - start).count());
    }

    std::printf("a page of %d different ideographs, GL calls dropped    engine   by hand\n", IDEOGRAPHS);
    std::printf("  laid out and drawn, milliseconds                   %8.3f  %8.3f\n", changed * 1e3,
                changedByHand * 1e3);
    std::printf("  drawn again, unchanged, microseconds               %8.2f  %8.2f\n", unchanged * 1e6,
                unchangedByHand * 1e6);
    std::printf("  glyphs never seen before, microseconds each        %8.2f\n", drawn * 1e6 / IDEOGRAPHS);
    return true;
}

} // namespace

int main()
{
    orv::setLogLevel(orv::LogLevel::WARNING);
    std::string error;
    const auto gl = headless::Context::create({}, error);
    if (!gl)
    {
        std::fprintf(stderr, "no GL context: %s\n", error.c_str());
        return 1;
    }
    const auto pool = makeShared<AssetCachePool>();
    registerSource(*pool, "/usr/share/fonts/truetype/dejavu", false); // package fonts-dejavu-core
    registerSource(*pool, "/usr/share/fonts/truetype", false);        // and fonts-droid-fallback
    const bool isDone = run(*pool) && runIdeographs(*pool);
    pool->flush();
    pool->flush();
    return isDone ? 0 : 1;
}
