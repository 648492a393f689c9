#include "pictures.h"

#include "stage/framing.h"
#include "stage/scenesize.h"

#include "commandline/terminaltext.h"
#include "glcalls/glcalls.h"
#include "headless/headless.h"
#include "headless/png.h"

#include <chrono>
#include <cmath>
#include <cstdio>
#include <cstring>
#include <filesystem>

#include <unistd.h>

namespace view
{

namespace
{

constexpr int SAMPLES = 4;
constexpr int LINE_GREY = 128; // between the pictures of a sheet
constexpr float FULL_TURN = 6.2831853f;

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

/// Evenly spaced over the clip, or around the scene: the last one lies one step before the end, so that the
/// pictures can be looped.
std::vector<Shot> chooseShots(const Options& options, const Clip& clip)
{
    std::vector<Shot> shots;
    shots.reserve(size_t(options.turntable));
    for (int i = 0; i < options.turntable; ++i)
        shots.push_back({clip.start + options.time, FULL_TURN * float(i) / float(options.turntable)});
    const int moments = options.frames + (shots.empty() ? options.columns * options.rows : 0);
    shots.reserve(shots.size() + size_t(moments));
    for (int i = 0; i < moments; ++i)
        shots.push_back({clip.start + (clip.end - clip.start) * float(i) / float(moments), 0.0f});
    if (shots.empty())
        shots.push_back({clip.start + options.time, 0.0f});
    return shots;
}

/// "FRAME-007.png" for the eighth of many.
std::string insertBeforeSuffix(const std::string& name, const std::string& inserted)
{
    std::filesystem::path path(name);
    path.replace_filename(path.stem().string() + "-" + inserted + path.extension().string());
    return path.string();
}

std::string numberOf(size_t index)
{
    const std::string number = std::to_string(index);
    return std::string(number.size() < 3 ? 3 - number.size() : 0, '0') + number;
}

/// With a grey line above and to the left, except at the edges of the sheet.
void copyInto(PngPicture& sheet, const PngPicture& picture, int column, int row)
{
    const auto getPlace = [&](int x, int y)
    {
        return &sheet.rgba[(size_t(row * picture.height + y) * size_t(sheet.width) +
                            size_t(column * picture.width + x)) *
                           4];
    };
    const size_t lineSize = size_t(picture.width) * 4;
    for (int y = 0; y < picture.height; ++y)
    {
        std::memcpy(getPlace(0, y), &picture.rgba[size_t(y) * lineSize], lineSize);
        if (column > 0)
            std::memset(getPlace(0, y), LINE_GREY, 3);
    }
    for (int x = 0; row > 0 && x < picture.width; ++x)
        std::memset(getPlace(x, 0), LINE_GREY, 3);
}

PngPicture makeSheet(const Options& options, const orv::Colour4f& background)
{
    PngPicture sheet{options.columns * options.width, options.rows * options.height, {}};
    const uint8_t pixel[] = {uint8_t(std::lround(background.r * 255.0f)),
                             uint8_t(std::lround(background.g * 255.0f)),
                             uint8_t(std::lround(background.b * 255.0f)), 255};
    sheet.rgba.resize(size_t(sheet.width) * size_t(sheet.height) * 4);
    for (size_t i = 0; i < sheet.rgba.size(); ++i)
        sheet.rgba[i] = pixel[i % 4];
    return sheet;
}

bool write(const std::string& path, const PngPicture& picture, std::string& error)
{
    return headless::writePng(path, picture.width, picture.height, picture.rgba.data(), error);
}

bool compare(const Options& options, const PngPicture& picture, std::string& error)
{
    PngPicture reference;
    if (!readPng(options.reference, reference, error))
        return false;
    if (reference.width != picture.width || reference.height != picture.height)
    {
        error = options.reference + ": has " + std::to_string(reference.width) + " x " +
                std::to_string(reference.height) + " pixels, the picture " + std::to_string(picture.width) +
                " x " + std::to_string(picture.height);
        return false;
    }
    const Difference difference = comparePictures(reference, picture, options.tolerance);
    const std::string path = insertBeforeSuffix(options.out, "difference");
    if (!write(path, difference.picture, error))
        return false;
    std::printf("%s: %s; %s\n", difference.isTolerable ? "same" : "different",
                describe(difference, options.tolerance).c_str(), path.c_str());
    return difference.isTolerable;
}

/// One run of the program without a window.
class Session
{
public:
    Session(const Options& options, Stage& stage, const headless::Context& context,
            const orv::RenderContext::Ptr& renderContext)
        : m_options(options)
        , m_stage(stage)
        , m_context(context)
        , m_markings(renderContext)
        , m_player(stage.getAnimation(), stage.getClips())
    {
        for (const Marking marking : options.markings)
            m_markings.toggle(marking);
    }

    bool run(std::string& error);
    const FrameStats& getStats() const { return m_stats; }

private:
    bool prepare(std::string& error);
    bool draw(const Shot& shot, PngPicture& picture, std::string& error);
    bool drawAll(PngPicture& whole, std::string& error);

    const Options& m_options;
    Stage& m_stage;
    const headless::Context& m_context;
    Markings m_markings;
    Player m_player;
    std::vector<Shot> m_shots;
    Orbit m_orbit;
    FrameStats m_stats;
};

bool Session::prepare(std::string& error)
{
    if (!m_options.clip.empty() && !m_player.chooseClip(m_options.clip, error))
        return false;
    const Clip& clip = m_player.getClip();
    m_shots = chooseShots(m_options, clip);
    if (m_shots.size() > 1 && m_options.turntable == 0 && clip.end <= clip.start)
        std::fprintf(stderr, "orv-view: %s: not animated, all pictures will be the same\n",
                     commandline::toTerminalText(m_options.scene.path).c_str());
    if (m_options.background)
        m_stage.setBackground(*m_options.background);
    if (m_options.camera.empty())
    {
        m_orbit = frameScene(m_stage, m_player, m_shots, m_options.width, m_options.height);
        return true;
    }
    const int camera = m_stage.findCamera(m_options.camera, error);
    if (camera >= 0)
        m_stage.useCamera(camera);
    return camera >= 0;
}

bool Session::draw(const Shot& shot, PngPicture& picture, std::string& error)
{
    m_player.seek(shot.time);
    m_stage.setShaderTime(shot.time);
    if (m_options.camera.empty())
    {
        Orbit orbit = m_orbit;
        orbit.yaw += shot.turn;
        orbit.apply(m_stage.getFreeCamera());
    }
    glcalls::resetCounts();
    const Stopwatch watch;
    m_markings.draw(m_stage, m_options.width, m_options.height);
    m_stats.glCalls = glcalls::total();
    m_stats.draws = glcalls::count(glDrawElements) + glcalls::count(glDrawArrays);
    glFinish();
    m_stats.milliseconds = watch.milliseconds();

    if (const GLenum code = glGetError())
    {
        char text[40];
        std::snprintf(text, sizeof text, "GL error 0x%04x while drawing", code);
        error = m_options.out + ": not written: " + text;
        return false;
    }
    picture = {m_options.width, m_options.height, m_context.readPixels()};
    for (size_t i = 3; i < picture.rgba.size(); i += 4)
        picture.rgba[i] = 255; // blending may leave alpha below 1, which would show as holes
    return true;
}

/// @param whole  set to the only picture, or to the last of several.
bool Session::drawAll(PngPicture& whole, std::string& error)
{
    const bool isSheet = m_options.columns > 0;
    const bool isNumbered = !isSheet && m_options.frames + m_options.turntable > 0;
    const bool showsProgress = m_shots.size() > 1 && isatty(STDERR_FILENO);
    PngPicture sheet;
    if (isSheet)
        sheet = makeSheet(m_options, m_stage.getBackground());
    for (size_t i = 0; i < m_shots.size(); ++i)
    {
        if (showsProgress)
            std::fprintf(stderr, "\rpicture %zu of %zu", i + 1, m_shots.size());
        if (!draw(m_shots[i], whole, error) ||
            (isNumbered && !write(insertBeforeSuffix(m_options.out, numberOf(i)), whole, error)))
            return false;
        if (isSheet)
            copyInto(sheet, whole, int(i) % m_options.columns, int(i) / m_options.columns);
    }
    if (showsProgress)
        std::fputc('\n', stderr);
    if (isSheet)
        whole = std::move(sheet);
    return isNumbered || write(m_options.out, whole, error);
}

bool Session::run(std::string& error)
{
    if (!prepare(error))
    {
        error = m_options.scene.path + ": " + error;
        return false;
    }
    PngPicture picture;
    if (m_options.columns > 0)
        picture = makeSheet(m_options, m_stage.getBackground());
    return drawAll(picture, error) && (m_options.reference.empty() || compare(m_options, picture, error));
}

void printStats(const Options& options, const SceneSize& size, double loadMilliseconds,
                const FrameStats& frame)
{
    const bool isOneOfMany = options.frames > 1 || options.turntable > 1 || options.columns > 0;
    std::printf("%s\n", commandline::toTerminalText(options.scene.path).c_str());
    std::printf("  solids     %d\n", size.solids);
    std::printf("  draws      %llu\n", static_cast<unsigned long long>(frame.draws));
    std::printf("  triangles  %ld\n", size.triangles);
    std::printf("  GL calls   %llu\n", static_cast<unsigned long long>(frame.glCalls));
    std::printf("  load       %.1f ms\n", loadMilliseconds);
    std::printf("  frame      %.1f ms%s\n", frame.milliseconds, isOneOfMany ? " (the last one)" : "");
}

} // namespace

bool drawPictures(const Options& options, const std::string& scenePath, std::string& error)
{
    headless::Options surface;
    surface.width = options.width;
    surface.height = options.height;
    surface.samples = SAMPLES;
    const std::unique_ptr<headless::Context> context = headless::Context::create(surface, error);
    if (!context)
        return false;

    const Stopwatch watch;
    Studio studio;
    SceneFile file = options.scene;
    file.path = scenePath;
    const std::unique_ptr<Stage> stage = Stage::load(studio, file, error);
    const double loadMilliseconds = watch.milliseconds();
    if (!stage)
        return false;
    const SceneSize size = measureScene(stage->getScene());
    if (size.solids == 0)
        std::fprintf(stderr, "orv-view: %s: nothing to see in it\n",
                     commandline::toTerminalText(options.scene.path).c_str());

    Session session(options, *stage, *context, studio.getContext());
    const bool isDrawn = session.run(error);
    if (isDrawn && options.wantsStats)
        printStats(options, size, loadMilliseconds, session.getStats());
    return isDrawn;
}

} // namespace view
