#include "viewer.h"

#include "fontsearch.h"
#include "framing.h"
#include "picker.h"

#include "glcalls/glcalls.h"
#include "headless/headless.h"
#include "headless/png.h"

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <filesystem>

namespace view
{

namespace fs = std::filesystem;
using namespace std::chrono_literals;

namespace
{

constexpr auto LOOK_INTERVAL = 150ms;    // at the files
constexpr auto WRITING_INTERVAL = 200ms; // what stands over the picture, while it moves
constexpr auto MESSAGE_TIME = 4s;
constexpr auto SHORTEST_FRAME = 4ms; // where the driver does not wait for the screen
constexpr size_t FRAMED_MOMENTS = 8;
constexpr float SKIP_SHARE = 0.05f; // of the clip, with the arrow keys
constexpr float CLOSER_STEPS = 5.0f;
constexpr float LONGEST_STEP = 0.25f;       // seconds, of what is played
constexpr float SHADER_TIME_SPAN = 3600.0f; // seconds; more would be too coarse for floats
constexpr unsigned FONT_SIZE = 17;

const orv::Colour4f BACKGROUNDS[] = {{0.84f, 0.86f, 0.89f, 1.0f},
                                     {0.2f, 0.22f, 0.25f, 1.0f},
                                     {1.0f, 1.0f, 1.0f, 1.0f},
                                     {0.0f, 0.0f, 0.0f, 1.0f}};

const std::vector<HeadsUp::Row> KEYS = {
    {"left button", "turn"},
    {"right button, shift + left", "move"},
    {"wheel", "nearer and farther"},
    {"double click", "look at what is there from closer"},
    {"f", "the whole scene"},
    {"c, shift + c", "next and previous camera of the file, and the free one"},
    {"", ""},
    {"space", "play and pause"},
    {". ,", "one frame on and back"},
    {"right, left", "some way on and back"},
    {"home, end, 0 to 9", "start, end, that tenth of it"},
    {"+ -", "faster and slower"},
    {"l", "loop or stop at the end"},
    {"n, shift + n", "next and previous clip"},
    {"", ""},
    {"s, shift + s", "save a picture, without and with this writing"},
    {"b", "next background"},
    {"i", "this writing on and off"},
    {"r", "load again (happens by itself when a file changes)"},
    {"h", "these keys"},
    {"q, escape", "leave"},
};

/// "1 draw", "4,212 triangles"
std::string count(uint64_t number, const char* what)
{
    std::string text = std::to_string(number);
    for (int i = int(text.size()) - 3; i > 0; i -= 3)
        text.insert(size_t(i), ",");
    return text + " " + what + (number == 1 ? "" : "s");
}

std::string toText(const char* format, double value)
{
    char text[40];
    std::snprintf(text, sizeof text, format, value);
    return text;
}

/// The first name on the way up, since the parts of a node have none.
const char* findName(const orv::SceneNode& node)
{
    for (const orv::SceneNode* above = &node; above; above = above->getParent())
    {
        if (above->getName()[0])
            return above->getName();
    }
    return "without a name";
}

} // namespace

Viewer::Viewer(const Options& options, Conversion* conversion) : m_options(options), m_conversion(conversion)
{
}

Viewer::~Viewer()
{
    m_headsUp.reset(); // both before the window, with whose GL they are
    m_scene.reset();
}

bool Viewer::open(std::string& error)
{
    window::Options wanted;
    wanted.title = fs::path(m_options.scene.path).filename().string() + " - orv-view";
    wanted.width = m_options.width;
    wanted.height = m_options.height;
    m_window = window::Window::create(wanted, error);
    if (!m_window)
    {
        error = "no window: " + error + "; with --out FRAME.png the picture is drawn without one";
        return false;
    }
    m_scene = std::make_unique<LiveScene>(m_options.scene, m_conversion);
    if (!m_scene->load(error))
        return false;
    if (m_options.background)
        getStage().setBackground(*m_options.background);
    openHeadsUp();
    say("h shows the keys");
    return chooseBeginning(error);
}

bool Viewer::chooseBeginning(std::string& error)
{
    const bool hasClip = m_options.clip.empty() || getPlayer().chooseClip(m_options.clip, error);
    frameAll();
    if (hasClip && !m_options.camera.empty())
        m_camera = getStage().findCamera(m_options.camera, error);
    if (m_camera >= 0)
        getStage().useCamera(m_camera);
    if (error.empty())
        return true;
    error = m_options.scene.path + ": " + error;
    return false;
}

void Viewer::openHeadsUp()
{
    const std::string font = m_options.font.empty() ? findFont(getFontFolders()) : m_options.font;
    const auto size = unsigned(std::lround(float(FONT_SIZE) * m_window->getScale()));
    if (!font.empty())
        m_headsUp = HeadsUp::create(m_scene->getStudio().getContext(), font, size);
    if (!m_headsUp)
        std::fprintf(stderr, "orv-view: nothing can be written in the window: %s; --font names one\n",
                     font.empty() ? "no font was found" : (font + " is no font that can be used").c_str());
}

void Viewer::checkFiles()
{
    if (Clock::now() - m_lastLook < LOOK_INTERVAL)
        return;
    m_lastLook = Clock::now();
    if (m_scene->hasChanged())
        reload();
}

void Viewer::reload()
{
    const std::string camera = m_camera >= 0 ? getStage().getCameraName(m_camera) : std::string();
    std::string error;
    if (!m_scene->reload(error))
        return say("The last good picture stays: " + error);

    m_camera = m_camera >= 0 ? getStage().findCamera(camera, error) : -1;
    if (m_camera >= 0)
        getStage().useCamera(m_camera);
    const Orbit whole = findView(); // it may be larger, or elsewhere
    m_orbit.centre = whole.centre;
    m_orbit.radius = whole.radius;
    m_needsFrame = true;
    say("Loaded again");
}

void Viewer::handle(const window::Event& event)
{
    using Type = window::Event::Type;
    switch (event.type)
    {
    case Type::QUIT: m_quits = true; break;
    case Type::SHOW: m_needsFrame = true; break;
    case Type::KEY: handleKey(event.key, event.shift); break;
    case Type::PRESS: handlePress(event); break;
    case Type::RELEASE: m_held = window::Button::NONE; break;
    case Type::MOVE: handleMove(event); break;
    case Type::WHEEL:
        leaveFileCamera();
        m_orbit.zoom(event.turns);
        m_needsFrame = true;
        break;
    case Type::LEAVE:
        m_isPointerInside = false;
        m_isPickOld = true;
        break;
    case Type::OTHER: break;
    }
}

void Viewer::handleKey(int32_t key, bool shift)
{
    m_needsFrame = true;
    m_needsWriting = true;
    if (key >= '0' && key <= '9')
        return getPlayer().seekShare(float(key - '0') / 10.0f);
    const float length = getPlayer().getClip().end - getPlayer().getClip().start;
    switch (key)
    {
    case window::key::ESCAPE:
    case 'q': m_quits = true; break;
    case 'f': frameAll(); break;
    case 'c': stepCamera(shift ? -1 : 1); break;
    case ' ': getPlayer().togglePaused(); break;
    case '.': getPlayer().step(1); break;
    case ',': getPlayer().step(-1); break;
    case window::key::RIGHT: getPlayer().skip(length * SKIP_SHARE); break;
    case window::key::LEFT: getPlayer().skip(-length * SKIP_SHARE); break;
    case window::key::HOME: getPlayer().seekShare(0.0f); break;
    case window::key::END: getPlayer().seekShare(1.0f); break;
    case '+':
    case '=': // where the + is on the same key
    case window::key::KEYPAD_PLUS: getPlayer().scaleSpeed(2.0f); break;
    case '-':
    case window::key::KEYPAD_MINUS: getPlayer().scaleSpeed(0.5f); break;
    case 'l': getPlayer().setLooping(!getPlayer().isLooping()); break;
    case 'n': stepClip(shift ? -1 : 1); break;
    case 's': saveScreenshot(shift); break;
    case 'b': stepBackground(); break;
    case 'i': m_showsLines = !m_showsLines; break;
    case 'r': reload(); break;
    case 'h':
    case window::key::F1:
        m_showsKeys = !m_showsKeys;
        if (m_headsUp)
            m_headsUp->setTable(m_showsKeys ? KEYS : std::vector<HeadsUp::Row>());
        break;
    default: break;
    }
}

void Viewer::handlePress(const window::Event& event)
{
    m_held = event.button;
    m_pans = event.shift || event.button != window::Button::LEFT;
    m_pointerX = event.x;
    m_pointerY = event.y;
    if (event.button == window::Button::LEFT && event.clicks == 2)
        lookCloser(event.x, event.y);
}

void Viewer::handleMove(const window::Event& event)
{
    const float right = event.x - m_pointerX;
    const float down = event.y - m_pointerY;
    m_pointerX = event.x;
    m_pointerY = event.y;
    m_isPointerInside = true;
    m_isPickOld = true;
    if (m_held == window::Button::NONE)
        return;
    leaveFileCamera();
    if (m_pans)
        m_orbit.pan(right, down, float(std::min(m_window->getWidth(), m_window->getHeight())));
    else
        m_orbit.turn(right / m_window->getScale(), down / m_window->getScale());
    m_needsFrame = true;
}

/// The whole scene in sight, over the whole clip.
Orbit Viewer::findView()
{
    const float time = getPlayer().getTime();
    const Clip& clip = getPlayer().getClip();
    std::vector<Shot> moments;
    for (size_t i = 0; i < FRAMED_MOMENTS && (i == 0 || clip.end > clip.start); ++i)
        moments.push_back({clip.start + (clip.end - clip.start) * float(i) / float(FRAMED_MOMENTS), 0.0f});
    const Orbit orbit =
        frameScene(getStage(), getPlayer(), moments, m_window->getWidth(), m_window->getHeight());
    getPlayer().seek(time);
    return orbit;
}

void Viewer::frameAll()
{
    m_orbit = findView();
    m_camera = -1;
    getStage().useFreeCamera();
    m_needsFrame = true;
}

void Viewer::lookCloser(float x, float y)
{
    const orv::Ray ray =
        castThrough(getStage().getCamera(), x, y, float(m_window->getWidth()), float(m_window->getHeight()));
    const Hit hit = view::pick(getStage().getMeshes(), getStage().getScene(), ray);
    if (!hit.solid)
        return;
    leaveFileCamera();
    m_orbit.middle = ray.position + ray.direction * hit.distance;
    m_orbit.distance = length(m_orbit.middle - getStage().getCamera().getWorldTransform()[3].xyz());
    m_orbit.zoom(CLOSER_STEPS);
    m_needsFrame = true;
}

void Viewer::stepClip(int count)
{
    if (getPlayer().getClips().size() > 1)
        getPlayer().stepClip(count);
    else
        say("There are no other clips");
}

void Viewer::stepCamera(int count)
{
    const int cameras = getStage().getCameraCount() + 1; // with the free one, before the first
    m_camera = (m_camera + 1 + count + cameras) % cameras - 1;
    if (m_camera >= 0)
        getStage().useCamera(m_camera);
    else
        getStage().useFreeCamera();
    if (cameras == 1)
        say("There are no other cameras");
}

void Viewer::leaveFileCamera()
{
    if (m_camera < 0)
        return;
    m_orbit.continueFrom(getStage().getCamera());
    m_camera = -1;
    getStage().useFreeCamera();
}

void Viewer::stepBackground()
{
    m_background = (m_background + 1) % std::size(BACKGROUNDS);
    getStage().setBackground(BACKGROUNDS[m_background]);
}

/// Beside the user, not beside the scene: "duck-001.png" or the next name that is free.
void Viewer::saveScreenshot(bool withHeadsUp)
{
    const int width = m_window->getWidth();
    const int height = m_window->getHeight();
    drawPicture();
    if (withHeadsUp && m_headsUp)
        m_headsUp->draw(width, height);
    std::vector<uint8_t> pixels = headless::readSurface(width, height);
    for (size_t i = 3; i < pixels.size(); i += 4)
        pixels[i] = 255;

    const std::string stem = fs::path(m_options.scene.path).stem().string();
    std::string name;
    for (int number = 1; name.empty() || fs::exists(name); ++number)
    {
        const std::string digits = std::to_string(number);
        name = stem + "-" + std::string(digits.size() < 3 ? 3 - digits.size() : 0, '0') + digits + ".png";
    }
    std::string error;
    say(headless::writePng(name, width, height, pixels.data(), error) ? "Saved " + name : error);
}

bool Viewer::isMoving() const
{
    return getPlayer().isMoving() || (getStage().usesShaderTime() && !getPlayer().isPaused());
}

void Viewer::advance()
{
    const Clock::time_point now = Clock::now();
    const float seconds = std::min(std::chrono::duration<float>(now - m_lastAdvance).count(), LONGEST_STEP);
    m_lastAdvance = now;
    if (isMoving())
    {
        getPlayer().update(seconds);
        m_shaderTime = std::fmod(m_shaderTime + seconds * getPlayer().getSpeed(), SHADER_TIME_SPAN);
        getStage().setShaderTime(m_shaderTime);
        m_needsFrame = true;
    }
    else if (m_held == window::Button::NONE)
        m_stats.rest();
    if (!m_message.empty() && now >= m_messageEnd)
    {
        m_message.clear();
        m_needsWriting = true;
    }
}

void Viewer::drawPicture()
{
    if (m_camera < 0)
        m_orbit.apply(getStage().getFreeCamera());
    getStage().draw(m_window->getWidth(), m_window->getHeight());
}

void Viewer::drawFrame()
{
    m_needsFrame = false;
    m_isPickOld = true;
    glcalls::resetCounts();
    drawPicture();
    m_stats.glCalls = glcalls::total();
    m_stats.draws = glcalls::count(glDrawElements) + glcalls::count(glDrawArrays);
    if (m_headsUp && (m_showsLines || m_showsKeys))
        m_headsUp->draw(m_window->getWidth(), m_window->getHeight());
    m_window->show();
    m_stats.addFrame(std::chrono::duration<double>(Clock::now().time_since_epoch()).count());
}

void Viewer::pick()
{
    m_isPickOld = false;
    m_underPointer.clear();
    if (!m_isPointerInside || m_held != window::Button::NONE)
        return;
    const orv::Ray ray = castThrough(getStage().getCamera(), m_pointerX, m_pointerY,
                                     float(m_window->getWidth()), float(m_window->getHeight()));
    if (const orv::Solid* solid = view::pick(getStage().getMeshes(), getStage().getScene(), ray).solid)
        m_underPointer = findName(*solid);
}

void Viewer::say(const std::string& message)
{
    m_message = message;
    m_messageEnd = Clock::now() + MESSAGE_TIME;
    m_needsWriting = true;
    if (!m_headsUp)
        std::fprintf(stderr, "orv-view: %s\n", message.c_str());
}

std::string Viewer::describePlace() const
{
    const Clip& clip = getPlayer().getClip();
    std::string text;
    if (clip.end > clip.start)
    {
        text += "\n" + clip.name + "   " + toText("%.2f", getPlayer().getTime() - clip.start) +
                toText(" of %.2f s", clip.end - clip.start);
        text += getPlayer().isMoving()   ? "   playing"
                : getPlayer().isPaused() ? "   paused"
                                         : "   at its end";
        if (getPlayer().getSpeed() != 1.0f)
            text += toText(", speed %g", getPlayer().getSpeed());
        text += getPlayer().isLooping() ? ", in a loop" : ", once";
    }
    if (m_camera >= 0)
        text += "\ncamera " + getStage().getCameraName(m_camera);
    return text;
}

void Viewer::writeHeadsUp()
{
    const Clock::time_point now = Clock::now();
    if (!m_headsUp || (!m_needsWriting && now - m_lastWriting < WRITING_INTERVAL))
        return;
    m_lastWriting = now;
    m_needsWriting = false;
    if (m_isPickOld)
        pick();
    const double framesPerSecond = m_stats.getFramesPerSecond();
    std::string lines = framesPerSecond > 0.0 ? toText("%.0f fps", framesPerSecond) : "at rest";
    lines += "   " + count(m_stats.draws, "draw") + "   " + count(m_scene->getTriangleCount(), "triangle") +
             "   " + count(m_stats.glCalls, "GL call") + describePlace();
    if (!m_underPointer.empty())
        lines += "\nunder the pointer: " + m_underPointer;
    const bool isOther = m_headsUp->setLines(lines);
    m_needsFrame = m_headsUp->setMessage(m_message) || isOther || m_needsFrame;
}

bool Viewer::run(std::string& error)
{
    if (!open(error))
        return false;
    while (!m_quits)
    {
        const Clock::time_point start = Clock::now();
        window::Event event;
        if (!isMoving() && !m_needsFrame &&
            m_window->wait(event, int(std::chrono::milliseconds(LOOK_INTERVAL).count())))
            handle(event);
        while (m_window->poll(event))
            handle(event);
        checkFiles();
        advance();
        writeHeadsUp();
        if (!m_needsFrame)
            continue;
        drawFrame();
        const auto rest =
            std::chrono::duration_cast<std::chrono::milliseconds>(SHORTEST_FRAME - (Clock::now() - start));
        if (rest > 0ms && m_window->wait(event, int(rest.count())))
            handle(event);
    }
    return true;
}

} // namespace view
