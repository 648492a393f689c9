#pragma once

#include "convertedmodel.h"
#include "headsup.h"
#include "livescene.h"
#include "markings.h"
#include "options.h"

#include "stage/eyecontrol.h"
#include "stage/framestats.h"

#include "window/window.h"

#include <chrono>
#include <memory>
#include <string>

namespace view
{

/// The window and its commands.
///
/// It draws only while something changes: the scene, the view, or the text.
class Viewer
{
public:
    /// @param conversion  of the shown model, null for a scene; borrowed.
    Viewer(const Options& options, ConvertedModel* conversion);
    ~Viewer();

    Viewer(const Viewer&) = delete;
    Viewer& operator=(const Viewer&) = delete;

    /// Shows the window until it is closed.
    /// @return false, with the reason in error, if it cannot be opened or there is nothing to show.
    bool run(std::string& error);

private:
    using Clock = std::chrono::steady_clock;

    Stage& getStage() const { return m_scene->getStage(); }
    Player& getPlayer() const { return m_scene->getPlayer(); }

    bool openWindow(std::string& error);
    bool chooseBeginning(std::string& error);
    void openHeadsUp();

    void checkFiles();
    void reload();

    void handle(const window::Event& event);
    void handleKey(int32_t key, bool shift);
    void handlePress(const window::Event& event);
    void handleMove(const window::Event& event);
    void mark(Marking marking);
    void hide();
    void showAll();
    void toggleKeys();
    void toggleTree();
    void scrollTree(int rows);
    void fillTable();
    void open(const std::string& path);
    void frameAll();
    void stepClip(int count);
    void stepCamera(int count);
    void stepBackground();
    void savePicture(bool withHeadsUp);

    bool isMoving() const;
    void advance();
    void drawPicture();
    void drawFrame();
    void pick();
    void say(const std::string& message);
    void writeHeadsUp();

    Options m_options;
    ConvertedModel* m_conversion;
    std::unique_ptr<ConvertedModel> m_dropped; ///< of the last dropped file, if it is a model
    std::unique_ptr<window::Window> m_window;
    std::unique_ptr<LiveScene> m_scene;
    std::unique_ptr<Markings> m_markings;
    std::unique_ptr<HeadsUp> m_headsUp; ///< null without a font
    EyeControl m_eye;
    size_t m_background = 0;

    FrameStats m_stats;
    std::string m_message;
    orv::SharedPtr<orv::SceneNode> m_underPointer;
    bool m_showsLines = true;
    bool m_showsKeys = false;
    bool m_showsTree = false;
    int m_firstRow = 0; ///< of the tree that is shown

    window::Button m_held = window::Button::NONE;
    bool m_pans = false;
    float m_pointerX = 0.0f; ///< pixels
    float m_pointerY = 0.0f;
    bool m_isPointerInside = false;
    bool m_isPickOld = true;
    float m_shaderTime = 0.0f;
    Clock::time_point m_lastAdvance = Clock::now();
    Clock::time_point m_lastWriting;
    Clock::time_point m_lastLook = Clock::now();
    Clock::time_point m_messageEnd;
    bool m_needsFrame = true;
    bool m_needsWriting = true;
    bool m_quits = false;
};

} // namespace view
