#include "viewer.h"

#include "fontsearch.h"
#include "keys.h"
#include "screenshot.h"
#include "statuslines.h"

#include "orv/sceneutil.h"

#include "commandline/terminaltext.h"
#include "glcalls/glcalls.h"

#include "orv/picking.h"
#include "orv/ray.h"

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <filesystem>
#include <functional>

namespace view
{

namespace fs = std::filesystem;
using namespace std::chrono_literals;

namespace
{

constexpr auto LOOK_INTERVAL = 150ms;    // between polls of the files
constexpr auto WRITING_INTERVAL = 200ms; // between updates of the text, while something moves
constexpr auto MESSAGE_TIME = 4s;
constexpr auto SHORTEST_FRAME = 4ms;        // if the driver does not wait for the display
constexpr float SKIP_SHARE = 0.05f;         // of the clip, with the arrow keys
constexpr float LONGEST_STEP = 0.25f;       // seconds of playing
constexpr float SHADER_TIME_SPAN = 3600.0f; // seconds; more would be too coarse for floats
constexpr unsigned FONT_SIZE = 17;

const orv::Colour4f BACKGROUNDS[] = {{0.84f, 0.86f, 0.89f, 1.0f},
                                     {0.2f, 0.22f, 0.25f, 1.0f},
                                     {1.0f, 1.0f, 1.0f, 1.0f},
                                     {0.0f, 0.0f, 0.0f, 1.0f}};

/// The first name upwards, since the parts of a node have none.
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

Viewer::Viewer(const Options& options, ConvertedModel* conversion)
    : m_options(options)
    , m_conversion(conversion)
{
}

Viewer::~Viewer()
{
    m_headsUp.reset(); // before the window, which has their GL context
    m_markings.reset();
    m_underPointer.reset();
    m_scene.reset();
}

bool Viewer::openWindow(std::string& error)
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
    m_markings = std::make_unique<Markings>(m_scene->getStudio().getContext());
    for (const Marking marking : m_options.markings)
        m_markings->toggle(marking);
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
        m_eye.useCamera(getStage(), getStage().findCamera(m_options.camera, error));
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
    const std::string camera = m_eye.getCameraName(getStage());
    std::string error;
    m_underPointer.reset();
    m_markings->forget();
    if (!m_scene->reload(error))
        return say("The last good picture stays: " + error);

    m_eye.adopt(getStage(), getPlayer(), camera, m_window->getWidth(), m_window->getHeight());
    m_needsFrame = true;
    fillTable();
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
        m_eye.zoom(getStage(), event.turns);
        m_needsFrame = true;
        break;
    case Type::LEAVE:
        m_isPointerInside = false;
        m_isPickOld = true;
        break;
    case Type::DROP: open(event.path); break;
    case Type::OTHER: break;
    }
}

void Viewer::handleKey(int32_t key, bool shift)
{
    m_needsFrame = true;
    m_needsWriting = true;
    const float length = getPlayer().getClip().end - getPlayer().getClip().start;
    switch (findCommand(key))
    {
    case Command::NONE: break;
    case Command::FRAME_ALL: frameAll(); break;
    case Command::STEP_CAMERA: stepCamera(shift ? -1 : 1); break;
    case Command::TOGGLE_PAUSED: getPlayer().togglePaused(); break;
    case Command::FRAME_ON: getPlayer().step(1); break;
    case Command::FRAME_BACK: getPlayer().step(-1); break;
    case Command::SKIP_ON: getPlayer().skip(length * SKIP_SHARE); break;
    case Command::SKIP_BACK: getPlayer().skip(-length * SKIP_SHARE); break;
    case Command::GO_TO_START: getPlayer().seekShare(0.0f); break;
    case Command::GO_TO_END: getPlayer().seekShare(1.0f); break;
    case Command::GO_TO_TENTH: getPlayer().seekShare(float(key - '0') / 10.0f); break;
    case Command::FASTER: getPlayer().scaleSpeed(2.0f); break;
    case Command::SLOWER: getPlayer().scaleSpeed(0.5f); break;
    case Command::TOGGLE_LOOPING: getPlayer().setLooping(!getPlayer().isLooping()); break;
    case Command::STEP_CLIP: stepClip(shift ? -1 : 1); break;
    case Command::SAVE_SCREENSHOT: savePicture(shift); break;
    case Command::STEP_BACKGROUND: stepBackground(); break;
    case Command::TOGGLE_BOUNDS: mark(Marking::BOUNDS); break;
    case Command::TOGGLE_SKELETONS: mark(Marking::SKELETONS); break;
    case Command::TOGGLE_AXES: mark(Marking::AXES); break;
    case Command::TOGGLE_GRID: mark(Marking::GRID); break;
    case Command::TOGGLE_WIREFRAME: mark(Marking::WIREFRAME); break;
    case Command::TOGGLE_SHADOWS: mark(Marking::SHADOWS); break;
    case Command::HIDE: shift ? showAll() : hide(); break;
    case Command::TOGGLE_TREE: toggleTree(); break;
    case Command::TREE_UP: scrollTree(-1); break;
    case Command::TREE_DOWN: scrollTree(1); break;
    case Command::TOGGLE_FULL_SCREEN: m_window->setFullScreen(!m_window->isFullScreen()); break;
    case Command::TOGGLE_LINES: m_showsLines = !m_showsLines; break;
    case Command::RELOAD: reload(); break;
    case Command::TOGGLE_KEYS: toggleKeys(); break;
    case Command::QUIT: m_quits = true; break;
    }
}

void Viewer::mark(Marking marking)
{
    m_markings->toggle(marking);
}

void Viewer::hide()
{
    if (m_isPickOld)
        pick();
    if (!m_underPointer)
        return say("There is nothing under the pointer");
    m_underPointer->setVisible(false);
    m_isPickOld = true;
    fillTable();
}

void Viewer::showAll()
{
    const std::function<void(orv::SceneNode&)> show = [&](orv::SceneNode& node)
    {
        node.setVisible(true);
        for (const orv::SharedPtr<orv::SceneNode>& child : node.getChildren())
            show(*child);
    };
    show(getStage().getScene());
    m_isPickOld = true;
    fillTable();
}

void Viewer::toggleKeys()
{
    m_showsKeys = !m_showsKeys;
    m_showsTree = false;
    fillTable();
}

void Viewer::toggleTree()
{
    m_showsTree = !m_showsTree;
    m_showsKeys = false;
    m_firstRow = 0;
    fillTable();
}

void Viewer::scrollTree(int rows)
{
    m_firstRow += rows;
    fillTable();
}

/// The keys, or the visible part of the tree.
void Viewer::fillTable()
{
    if (!m_headsUp)
        return;
    std::vector<HeadsUp::Row> rows;
    if (m_showsKeys)
        rows = listKeys();
    if (m_showsTree)
    {
        rows = listNodes(getStage().getTopNode());
        const int room = m_headsUp->countRows(m_window->getHeight());
        m_firstRow = std::clamp(m_firstRow, 0, std::max(int(rows.size()) - room, 0));
        rows.erase(rows.begin(), rows.begin() + m_firstRow);
        rows.resize(std::min(rows.size(), size_t(room)));
    }
    m_headsUp->setTable(rows);
}

/// Shows another file, or keeps the current one if that fails.
void Viewer::open(const std::string& path)
{
    std::string error;
    std::unique_ptr<ConvertedModel> conversion;
    bool isReady = true;
    if (getFileKind(path) == FileKind::MODEL)
    {
        conversion = ConvertedModel::create(path, m_options.converterArguments, error);
        isReady = conversion && conversion->run(error);
    }
    const orv::Colour4f background = getStage().getBackground();
    m_underPointer.reset();
    m_markings->forget();
    m_needsFrame = true;
    if (!isReady || !m_scene->open({path, {}}, conversion.get(), error))
        return say("What is shown stays: " + error);
    m_dropped = std::move(conversion);
    m_conversion = m_dropped.get();
    m_options.scene = {path, {}};
    getStage().setBackground(background);
    m_window->setTitle(fs::path(path).filename().string() + " - orv-view");
    frameAll();
    fillTable();
    say("h shows the keys");
}

void Viewer::handlePress(const window::Event& event)
{
    m_held = event.button;
    m_pans = event.shift || event.button != window::Button::LEFT;
    m_pointerX = event.x;
    m_pointerY = event.y;
    if (event.button == window::Button::LEFT && event.clicks == 2)
        m_eye.lookCloser(getStage(), event.x, event.y, m_window->getWidth(), m_window->getHeight());
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
    if (m_pans)
        m_eye.pan(getStage(), right, down, float(std::min(m_window->getWidth(), m_window->getHeight())));
    else
        m_eye.turn(getStage(), right / m_window->getScale(), down / m_window->getScale());
    m_needsFrame = true;
}

void Viewer::frameAll()
{
    m_eye.frameAll(getStage(), getPlayer(), m_window->getWidth(), m_window->getHeight());
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
    if (!m_eye.stepCamera(getStage(), count))
        say("There are no other cameras");
}

void Viewer::stepBackground()
{
    m_background = (m_background + 1) % std::size(BACKGROUNDS);
    getStage().setBackground(BACKGROUNDS[m_background]);
}

void Viewer::savePicture(bool withHeadsUp)
{
    const int width = m_window->getWidth();
    const int height = m_window->getHeight();
    drawPicture();
    if (withHeadsUp && m_headsUp)
        m_headsUp->draw(width, height);
    say(saveScreenshot(fs::path(m_options.scene.path).stem().string(), width, height));
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
    m_eye.apply(getStage());
    m_markings->draw(getStage(), m_window->getWidth(), m_window->getHeight());
}

void Viewer::drawFrame()
{
    m_needsFrame = false;
    m_isPickOld = true;
    glcalls::resetCounts();
    drawPicture();
    m_stats.glCalls = glcalls::total();
    m_stats.draws = glcalls::count(glDrawElements) + glcalls::count(glDrawArrays);
    if (m_headsUp && (m_showsLines || m_showsKeys || m_showsTree))
        m_headsUp->draw(m_window->getWidth(), m_window->getHeight());
    m_window->show();
    m_stats.addFrame(std::chrono::duration<double>(Clock::now().time_since_epoch()).count());
}

void Viewer::pick()
{
    m_isPickOld = false;
    m_underPointer.reset();
    if (!m_isPointerInside || m_held != window::Button::NONE)
        return;
    const orv::Ray ray = castThrough(getStage().getCamera(), m_pointerX, m_pointerY,
                                     float(m_window->getWidth()), float(m_window->getHeight()));
    for (const orv::PickHit& hit : orv::pick(getStage().getScene(), ray))
    {
        if (m_underPointer || !orv::getDerivedFlags(*hit.solid, orv::SceneNode::VISIBLE))
            continue;
        m_underPointer = hit.solid;
    }
}

void Viewer::say(const std::string& message)
{
    m_message = message;
    m_messageEnd = Clock::now() + MESSAGE_TIME;
    m_needsWriting = true;
    if (!m_headsUp)
        std::fprintf(stderr, "orv-view: %s\n", commandline::toTerminalText(message).c_str());
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
    std::string lines = describeFrame(m_stats, m_scene->getTriangleCount()) + describeClip(getPlayer());
    const std::string camera = m_eye.getCameraName(getStage());
    if (!camera.empty())
        lines += "\ncamera " + camera;
    const std::string marked = m_markings->describe();
    if (!marked.empty())
        lines += "\nshown: " + marked;
    if (m_underPointer)
        lines += std::string("\nunder the pointer: ") + findName(*m_underPointer);
    const bool isOther = m_headsUp->setLines(lines);
    m_needsFrame = m_headsUp->setMessage(m_message) || isOther || m_needsFrame;
}

bool Viewer::run(std::string& error)
{
    if (!openWindow(error))
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
