// The cost of a draw: the engine's frame beside a hand-written OpenGL ES 2.0 loop that draws the same picture.
//
// The scene is described in drawscene.h. Both sides draw through the same table of GL calls (glcalls).
// "GL calls" are those of one frame per draw. "User ms" is processor time of a whole frame on the real driver, all
// its threads. "Instructions" are those of one frame per draw with every GL call dropped, so that the driver is not
// counted; callgrind counts them where valgrind is installed. "Heap" is the memory of a cube after it was drawn.
//
// Arguments: numbers of cubes; 1000 5000 50000 without any. "--table" before them prints the engine's instructions alone,
// a line "name count" each, for ./run bench --check.

#include "callgrind.h"

#include "contender.h"
#include "orv/logsink.h"

#include "glcalls/glcalls.h"

#include <malloc.h>
#include <sys/resource.h>

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <iterator>

namespace
{

const char* const FOR_COUNTING = "--for-counting"; // what runs under callgrind

constexpr int WARM_FRAMES = 3;
constexpr int COUNTED_FRAMES = 2; // under callgrind

struct Figures
{
    double glCalls = 0.0; // of one frame
    double userMs = 0.0;  // of one frame
    double heapBytes = 0.0;
    std::vector<uint8_t> picture; // of the last frame
};

using MakeContender = std::unique_ptr<Contender> (*)(const DrawScene& scene);

constexpr MakeContender CONTENDERS[] = {makeWalkContender, makeByMaterialContender, makeGroupedContender,
                                        makeHandContender};
constexpr size_t CONTENDER_COUNT = std::size(CONTENDERS);

/// Name in the table; null for the hand-written loop.
constexpr const char* CONTENDER_NAMES[CONTENDER_COUNT] = {"walk", "by-material", "grouped", nullptr};

size_t getHeapBytes()
{
    const struct mallinfo2 info = mallinfo2();
    return info.uordblks + info.hblkhd;
}

double getUserMs()
{
    rusage usage;
    getrusage(RUSAGE_SELF, &usage);
    return double(usage.ru_utime.tv_sec) * 1e3 + double(usage.ru_utime.tv_usec) / 1e3;
}

Figures measure(MakeContender make, const DrawScene& scene)
{
    Figures figures;
    const std::unique_ptr<Contender> contender = make(scene);
    int frame = 0;
    for (; frame < WARM_FRAMES; ++frame)
        contender->draw(frame);
    glFinish();

    const int frames = std::clamp(20000 / int(scene.places.size()), 2, 20);
    const double start = getUserMs();
    for (int i = 0; i < frames; ++i)
        contender->draw(frame++);
    glFinish();
    figures.userMs = (getUserMs() - start) / frames;

    glcalls::resetCounts();
    contender->draw(frame);
    figures.glCalls = double(glcalls::total());
    figures.picture = contender->surface().readPixels();
    if (glGetError() != GL_NO_ERROR)
        giveUp("GL reports an error");
    return figures;
}

/// The share of pixels that differ clearly: rounding moves a few at the edges of cubes.
double compare(const std::vector<uint8_t>& a, const std::vector<uint8_t>& b)
{
    size_t differing = 0;
    for (size_t i = 0; i < a.size(); i += 4)
    {
        const auto differs = [&](size_t channel) { return std::abs(a[i + channel] - b[i + channel]) > 8; };
        if (differs(0) || differs(1) || differs(2))
            ++differing;
    }
    return double(differing) / double(a.size() / 4);
}

void drawDropped(Contender& contender, int frame)
{
    glcalls::dropAll();
    contender.draw(frame);
    glcalls::dropAll(false);
}

/// The heap for each further cube after it was drawn; without the driver, which is not called.
double measureHeap(MakeContender make)
{
    size_t bytes[2];
    const int counts[2] = {1000, 5000};
    for (int i = 0; i < 2; ++i)
    {
        const DrawScene scene(counts[i], DrawScene::Motion::ALL);
        const size_t before = getHeapBytes();
        const std::unique_ptr<Contender> contender = make(scene);
        for (int frame = 0; frame < WARM_FRAMES; ++frame)
            drawDropped(*contender, frame);
        bytes[i] = getHeapBytes() - before;
    }
    return double(bytes[1] - bytes[0]) / (counts[1] - counts[0]);
}

/// Calls use(scene, make) for every scene and contender, in their order.
template <class Use>
void forEachRun(const std::vector<int>& counts, Use use)
{
    for (int count : counts)
    {
        for (DrawScene::Motion motion : DrawScene::MOTIONS)
        {
            const DrawScene scene(count, motion);
            for (MakeContender make : CONTENDERS)
                use(scene, make);
        }
    }
}

/// Runs under callgrind.
void drawForCounting(const std::vector<int>& counts)
{
    forEachRun(counts,
               [](const DrawScene& scene, MakeContender make)
               {
                   const std::unique_ptr<Contender> contender = make(scene);
                   glcalls::dropAll();
                   int frame = 0;
                   for (; frame < WARM_FRAMES; ++frame)
                       contender->draw(frame);
                   const auto draw = [](void* object, int first)
                   {
                       for (int i = 0; i < COUNTED_FRAMES; ++i)
                           static_cast<Contender*>(object)->draw(first + i);
                   };
                   callgrind::measure(draw, contender.get(), frame);
                   glcalls::dropAll(false);
               });
}

void printAll(const char* format, const double (&values)[CONTENDER_COUNT])
{
    std::printf("  ");
    for (double value : values)
        std::printf(format, value);
}

void printScene(const DrawScene& scene, const Figures (&figures)[CONTENDER_COUNT],
                const uint64_t* instructions)
{
    const double draws = double(scene.places.size());
    double calls[CONTENDER_COUNT], times[CONTENDER_COUNT], counts[CONTENDER_COUNT];
    for (size_t i = 0; i < CONTENDER_COUNT; ++i)
    {
        if (compare(figures[0].picture, figures[i].picture) > 0.005)
            giveUp("the pictures differ, so the figures would not compare");
        calls[i] = figures[i].glCalls / draws;
        times[i] = figures[i].userMs;
        counts[i] = instructions ? double(instructions[i]) / COUNTED_FRAMES / draws : 0.0;
    }
    std::printf("%6d  %-8s", int(scene.places.size()), DrawScene::MOTION_NAMES[int(scene.motion)]);
    printAll(" %6.2f", calls);
    printAll(" %7.2f", times);
    if (instructions)
        printAll(" %6.1f", counts);
    std::printf("\n");
    std::fflush(stdout);
}

/// For every scene and contender, in their order; none without valgrind.
std::vector<uint64_t> countInstructions(const std::vector<int>& counts)
{
    if (!callgrind::isAvailable())
        return {};
    std::string arguments = FOR_COUNTING;
    for (int count : counts)
        arguments += " " + std::to_string(count);
    return callgrind::count(arguments, {"gl"}); // glDrawElements and glcalls::...
}

void printTable(const std::vector<int>& counts)
{
    const std::vector<uint64_t> instructions = countInstructions(counts);
    if (instructions.empty())
        giveUp("instructions cannot be counted; is valgrind installed?");
    size_t run = 0;
    for (int count : counts)
    {
        for (const char* motion : DrawScene::MOTION_NAMES)
        {
            for (const char* name : CONTENDER_NAMES)
            {
                const double draws = double(COUNTED_FRAMES) * count;
                if (name)
                    std::printf("drawbench/%d/%s/%s %.1f\n", count, motion, name,
                                double(instructions[run]) / draws);
                ++run;
            }
        }
    }
}

void compareContenders(const std::vector<int>& counts)
{
    const std::vector<uint64_t> instructions = countInstructions(counts);
    if (instructions.empty())
        std::printf("valgrind is not installed: instructions are not counted.\n");

    std::printf("Each in the order of the scene, of a scene by material, grouped, and by hand.\n\n");
    std::printf("%6s  %-8s  %-29s  %-33s  %s\n", "cubes", "turning", " GL calls per draw",
                " user ms per frame", " instructions per draw");
    size_t run = 0;
    Figures figures[CONTENDER_COUNT];
    forEachRun(counts,
               [&](const DrawScene& scene, MakeContender make)
               {
                   figures[run++ % CONTENDER_COUNT] = measure(make, scene);
                   if (run % CONTENDER_COUNT == 0)
                       printScene(scene, figures,
                                  run <= instructions.size() ? &instructions[run - CONTENDER_COUNT]
                                                             : nullptr);
               });
    std::printf("\nHeap bytes a cube: engine %.0f, by hand %.0f\n", measureHeap(makeWalkContender),
                measureHeap(makeHandContender));
}

} // namespace

int main(int argc, char** argv)
{
    orv::setLogLevel(orv::LogLevel::WARNING);
    const bool isForCounting = argc > 1 && !std::strcmp(argv[1], FOR_COUNTING);
    const bool isTable = argc > 1 && !std::strcmp(argv[1], "--table");
    std::vector<int> counts;
    for (int i = isForCounting || isTable ? 2 : 1; i < argc; ++i)
        counts.push_back(std::max(1, std::atoi(argv[i])));
    if (counts.empty())
        counts = {1000, 5000, 50000};
    if (isForCounting)
    {
        drawForCounting(counts);
        return EXIT_SUCCESS;
    }
    if (isTable)
    {
        printTable(counts);
        return EXIT_SUCCESS;
    }

    std::string error;
    const auto surface = headless::Context::create({}, error);
    if (!surface)
        giveUp(error.c_str());
    std::printf("%s\n\n", surface->describe().c_str());
    compareContenders(counts);
    return EXIT_SUCCESS;
}
