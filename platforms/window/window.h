#pragma once

#include <cstdint>
#include <memory>
#include <string>

/// A window with an OpenGL ES 2.0 context. Does not depend on the engine.
namespace window
{

struct Options
{
    std::string title;
    int width = 800; ///< of the picture, in the desktop's units
    int height = 600;
    int depthBits = 24;
    int stencilBits = 8;
    int samples = 4; ///< per pixel, for smooth edges; none if the driver does not support them
};

/// Keys without a character. Others are identified by their character in lower case.
namespace key
{
constexpr int32_t ESCAPE = 27;
constexpr int32_t F1 = 0x4000003A;
constexpr int32_t F11 = 0x40000044;
constexpr int32_t HOME = 0x4000004A;
constexpr int32_t END = 0x4000004D;
constexpr int32_t RIGHT = 0x4000004F;
constexpr int32_t LEFT = 0x40000050;
constexpr int32_t DOWN = 0x40000051;
constexpr int32_t UP = 0x40000052;
constexpr int32_t KEYPAD_MINUS = 0x40000056;
constexpr int32_t KEYPAD_PLUS = 0x40000057;
} // namespace key

enum class Button
{
    NONE,
    LEFT,
    MIDDLE,
    RIGHT
};

struct Event
{
    enum class Type
    {
        OTHER, ///< irrelevant
        QUIT,  ///< the window was closed, or the program told to end
        SHOW,  ///< the window's size or contents changed: draw again
        KEY,   ///< pressed, or repeated by itself
        PRESS,
        RELEASE,
        MOVE,
        WHEEL,
        LEAVE, ///< the pointer left the window
        DROP   ///< a file was dropped on the window
    };

    Type type = Type::OTHER;
    int32_t key = 0;
    bool shift = false;
    Button button = Button::NONE; ///< of PRESS and RELEASE
    int clicks = 0;               ///< 2 for the second press of a double click
    float x = 0.0f;               ///< of the pointer, in pixels from the upper left corner
    float y = 0.0f;
    float turns = 0.0f; ///< steps of the wheel, positive away from the user
    std::string path;   ///< of DROP
};

/// One window, with a GL context that is current on the thread that made it.
/// Threads: that thread only. One window at a time.
class Window
{
public:
    /// @param error  set to the reason on failure.
    static std::unique_ptr<Window> create(const Options& options, std::string& error);

    /// Deletes the GL objects with the window.
    ~Window();

    Window(const Window&) = delete;
    Window& operator=(const Window&) = delete;

    int getWidth() const; ///< of the picture in pixels, which may be finer than the desktop's units
    int getHeight() const;
    float getScale() const; ///< pixels for one of the desktop's units

    void setTitle(const std::string& title);

    /// Switches full screen on or off, without changing the resolution. A SHOW follows.
    void setFullScreen(bool isFull);
    bool isFullScreen() const;

    /// @return false if there is no event.
    bool poll(Event& event);
    /// Waits for an event so long at most.
    bool wait(Event& event, int milliseconds);

    /// Shows the drawn frame, at the next vertical sync if the driver supports it.
    void show();

private:
    struct Native;

    explicit Window(std::unique_ptr<Native> native);
    Event take(const void* nativeEvent);

    std::unique_ptr<Native> m_native;
};

} // namespace window
