// orv-view: draws a scene file into PNG pictures, without a window.

#include "framing.h"
#include "scenebounds.h"
#include "stage.h"

#include "glcalls/glcalls.h"
#include "headless/headless.h"
#include "headless/png.h"

#include <CLI/CLI.hpp>

#include <chrono>
#include <cmath>
#include <cstdio>
#include <cstdlib>
#include <filesystem>

#include <unistd.h>

namespace
{

constexpr int FAILED = 1; // exit codes
constexpr int MISUSED = 2;

constexpr int MAX_EDGE = 16384; // pixels
constexpr int MAX_FRAMES = 9999;
constexpr int SAMPLES = 4;

struct Options
{
    std::string scene;
    std::string out;
    std::string size = "800x600";
    int width = 0; // from size
    int height = 0;
    float time = 0.0f;
    int frames = 0; // 0: one picture, without a number
    std::string camera;
    bool wantsStats = false;
};

struct FrameStats
{
    uint64_t draws = 0;
    uint64_t glCalls = 0;
    double milliseconds = 0.0;
};

class Stopwatch
{
public:
    double milliseconds() const
    {
        return std::chrono::duration<double, std::milli>(Clock::now() - m_start).count();
    }

private:
    using Clock = std::chrono::steady_clock;
    Clock::time_point m_start = Clock::now();
};

bool complain(const std::string& message)
{
    std::fprintf(stderr, "orv-view: %s\n", message.c_str());
    return false;
}

/// @return "" or what is wrong, as CLI11 asks for.
std::string parseSize(const std::string& text, Options& options)
{
    char beyond = 0;
    const int found = std::sscanf(text.c_str(), "%dx%d%c", &options.width, &options.height, &beyond);
    if (found == 2 && options.width >= 1 && options.width <= MAX_EDGE && options.height >= 1 &&
        options.height <= MAX_EDGE)
        return "";
    return "a size is WIDTHxHEIGHT, each 1 to " + std::to_string(MAX_EDGE) + ", not " + text;
}

std::string checkPngName(const std::string& name)
{
    return std::filesystem::path(name).extension() == ".png" ? "" : name + ": only PNG can be written";
}

std::string checkTime(const std::string& text)
{
    char* end = nullptr;
    const float time = std::strtof(text.c_str(), &end);
    return *end || !std::isfinite(time) || time < 0.0f ? text + ": not a time in seconds, from 0 up" : "";
}

void addOptions(CLI::App& app, Options& options)
{
    app.add_option("scene", options.scene, "Scene file; its textures lie beside it")
        ->required()
        ->type_name("SCENE.glo");
    app.add_option("--out", options.out, "Picture to write")
        ->required()
        ->type_name("FRAME.png")
        ->check(checkPngName);
    app.add_option("--size", options.size, "In pixels")
        ->type_name("WxH")
        ->check([&options](const std::string& text) { return parseSize(text, options); })
        ->capture_default_str();
    auto* time = app.add_option("--time", options.time, "Moment of the animation to draw")
                     ->type_name("SECONDS")
                     ->check(checkTime);
    app.add_option("--frames", options.frames,
                   "Draw N pictures evenly spaced over the whole animation: FRAME-000.png and so on")
        ->type_name("N")
        ->check(CLI::Range(1, MAX_FRAMES))
        ->excludes(time);
    app.add_option("--camera", options.camera, "Look through this camera of the file, not at the whole scene")
        ->type_name("NAME");
    app.add_flag("--stats", options.wantsStats, "Print what the scene holds and what drawing it took");
}

/// The moments to draw: the last one lies one step before the end, so that the pictures can be looped.
std::vector<float> chooseTimes(const Options& options, const Stage& stage)
{
    if (options.frames == 0)
        return {options.time};
    std::vector<float> times;
    for (int i = 0; i < options.frames; ++i)
        times.push_back(stage.getStart() +
                        (stage.getEnd() - stage.getStart()) * float(i) / float(options.frames));
    return times;
}

/// FRAME.png, or FRAME-007.png for the eighth of many.
std::string nameOf(const Options& options, size_t index)
{
    if (options.frames == 0)
        return options.out;
    std::string number = std::to_string(index);
    number.insert(0, number.size() < 3 ? 3 - number.size() : 0, '0');
    std::filesystem::path path(options.out);
    path.replace_filename(path.stem().string() + "-" + number + path.extension().string());
    return path.string();
}

bool drawPicture(Stage& stage, const headless::Context& context, float time, const std::string& path,
                 FrameStats& stats)
{
    glcalls::resetCounts();
    const Stopwatch watch;
    stage.draw(time, context.getWidth(), context.getHeight());
    stats.milliseconds = watch.milliseconds();
    stats.glCalls = glcalls::total();
    stats.draws = glcalls::count(glDrawElements) + glcalls::count(glDrawArrays);

    char text[40];
    if (const GLenum code = glGetError())
    {
        std::snprintf(text, sizeof text, "GL error 0x%04x while drawing", code);
        return complain(path + ": not written: " + text);
    }
    std::vector<uint8_t> pixels = context.readPixels();
    for (size_t i = 3; i < pixels.size(); i += 4)
        pixels[i] = 255; // what blending leaves in alpha would show as holes
    std::string error;
    return headless::writePng(path, context.getWidth(), context.getHeight(), pixels.data(), error) ||
           complain(error);
}

void printStats(const Options& options, const SceneSize& size, double loadMilliseconds,
                const FrameStats& frame)
{
    std::printf("%s\n", options.scene.c_str());
    std::printf("  solids     %d\n", size.solids);
    std::printf("  draws      %llu\n", static_cast<unsigned long long>(frame.draws));
    std::printf("  triangles  %ld\n", size.triangles);
    std::printf("  GL calls   %llu\n", static_cast<unsigned long long>(frame.glCalls));
    std::printf("  load       %.1f ms\n", loadMilliseconds);
    std::printf("  frame      %.1f ms%s\n", frame.milliseconds, options.frames > 1 ? " (the last one)" : "");
}

bool run(const Options& options)
{
    std::string error;
    headless::Options surface;
    surface.width = options.width;
    surface.height = options.height;
    surface.samples = SAMPLES;
    const std::unique_ptr<headless::Context> context = headless::Context::create(surface, error);
    if (!context)
        return complain(error);

    const Stopwatch watch;
    const std::unique_ptr<Stage> stage = Stage::load(options.scene, error);
    const double loadMilliseconds = watch.milliseconds();
    if (!stage)
        return complain(error);

    const SceneSize size = measureScene(stage->getScene());
    const std::vector<float> times = chooseTimes(options, *stage);
    if (size.solids == 0)
        complain(options.scene + ": nothing to see in it");
    if (options.frames > 1 && stage->getEnd() <= stage->getStart())
        complain(options.scene + ": not animated, all pictures will be the same");
    if (options.camera.empty())
        frameScene(*stage, times, options.width, options.height);
    else if (!stage->chooseCamera(options.camera, error))
        return complain(options.scene + ": " + error);

    FrameStats stats;
    stage->draw(times.front(), options.width,
                options.height); // so that no time is that of the driver's start
    const bool showsProgress = times.size() > 1 && isatty(STDERR_FILENO);
    for (size_t i = 0; i < times.size(); ++i)
    {
        if (showsProgress)
            std::fprintf(stderr, "\rpicture %zu of %zu", i + 1, times.size());
        if (!drawPicture(*stage, *context, times[i], nameOf(options, i), stats))
            return false;
    }
    if (showsProgress)
        std::fputc('\n', stderr);
    if (options.wantsStats)
        printStats(options, size, loadMilliseconds, stats);
    return true;
}

} // namespace

int main(int argumentCount, char** arguments)
{
    Options options;
    CLI::App app("Draws a scene into a PNG picture, without a window.", "orv-view");
    addOptions(app, options);
    try
    {
        app.parse(argumentCount, arguments);
    }
    catch (const CLI::ParseError& error)
    {
        return app.exit(error) == 0 ? EXIT_SUCCESS : MISUSED; // 0: --help
    }
    parseSize(options.size, options);
    return run(options) ? EXIT_SUCCESS : FAILED;
}
