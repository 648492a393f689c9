// What text costs: glyphs a second laid out, and laid out and drawn again each time, with GL's calls dropped so that
// the engine's part alone counts; and what drawing an unchanged page takes. The best of several runs counts: what
// else the machine does can only add.

#include "glcalls/glcalls.h"
#include "headless/headless.h"

#include <orv/orv.h>

#include <algorithm>
#include <chrono>
#include <cmath>
#include <cstdio>
#include <string>

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
    const bool isDone = run(*pool);
    pool->flush();
    pool->flush();
    return isDone ? 0 : 1;
}
