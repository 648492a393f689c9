#include "window/window.h"

#include <SDL2/SDL.h>

namespace window
{

static_assert(key::ESCAPE == SDLK_ESCAPE && key::F1 == SDLK_F1 && key::HOME == SDLK_HOME &&
              key::END == SDLK_END && key::RIGHT == SDLK_RIGHT && key::LEFT == SDLK_LEFT &&
              key::F11 == SDLK_F11 && key::UP == SDLK_UP && key::DOWN == SDLK_DOWN &&
              key::KEYPAD_MINUS == SDLK_KP_MINUS && key::KEYPAD_PLUS == SDLK_KP_PLUS);

struct Window::Native
{
    SDL_Window* window = nullptr;
    SDL_GLContext context = nullptr;
    bool shift = false; ///< at the last event taken; the keyboard's state may be newer

    ~Native()
    {
        if (context)
            SDL_GL_DeleteContext(context);
        if (window)
            destroyWindow();
        SDL_Quit();
    }

    void destroyWindow()
    {
        // SDL ends its waiting with an event sent to the window on a second connection. If the window is already gone,
        // the X server reports an error, and SDL ends the program.
        SDL_PumpEvents();
        SDL_Delay(50);
        SDL_DestroyWindow(window);
        window = nullptr;
    }

    bool open(const Options& options, int samples)
    {
        SDL_GL_SetAttribute(SDL_GL_CONTEXT_PROFILE_MASK, SDL_GL_CONTEXT_PROFILE_ES);
        SDL_GL_SetAttribute(SDL_GL_CONTEXT_MAJOR_VERSION, 2);
        SDL_GL_SetAttribute(SDL_GL_CONTEXT_MINOR_VERSION, 0);
        SDL_GL_SetAttribute(SDL_GL_RED_SIZE, 8);
        SDL_GL_SetAttribute(SDL_GL_GREEN_SIZE, 8);
        SDL_GL_SetAttribute(SDL_GL_BLUE_SIZE, 8);
        SDL_GL_SetAttribute(SDL_GL_DEPTH_SIZE, options.depthBits);
        SDL_GL_SetAttribute(SDL_GL_STENCIL_SIZE, options.stencilBits);
        SDL_GL_SetAttribute(SDL_GL_MULTISAMPLEBUFFERS, samples > 0 ? 1 : 0);
        SDL_GL_SetAttribute(SDL_GL_MULTISAMPLESAMPLES, samples);
        window = SDL_CreateWindow(options.title.c_str(), SDL_WINDOWPOS_CENTERED, SDL_WINDOWPOS_CENTERED,
                                  options.width, options.height,
                                  SDL_WINDOW_OPENGL | SDL_WINDOW_RESIZABLE | SDL_WINDOW_ALLOW_HIGHDPI);
        context = window ? SDL_GL_CreateContext(window) : nullptr;
        if (context)
            return true;
        if (window)
            destroyWindow();
        return false;
    }
};

namespace
{

/// Without a screen, SDL falls back to windows that are not shown.
bool isVisible()
{
    const char* driver = SDL_GetCurrentVideoDriver();
    const bool isWanted = SDL_getenv("SDL_VIDEODRIVER") && *SDL_getenv("SDL_VIDEODRIVER");
    return driver && (isWanted || (SDL_strcmp(driver, "offscreen") != 0 && SDL_strcmp(driver, "dummy") != 0));
}

Button toButton(int button)
{
    switch (button)
    {
    case SDL_BUTTON_LEFT: return Button::LEFT;
    case SDL_BUTTON_MIDDLE: return Button::MIDDLE;
    case SDL_BUTTON_RIGHT: return Button::RIGHT;
    default: return Button::NONE;
    }
}

Event::Type toType(const SDL_WindowEvent& event)
{
    switch (event.event)
    {
    case SDL_WINDOWEVENT_EXPOSED:
    case SDL_WINDOWEVENT_SHOWN:
    case SDL_WINDOWEVENT_SIZE_CHANGED: return Event::Type::SHOW;
    case SDL_WINDOWEVENT_LEAVE: return Event::Type::LEAVE;
    default: return Event::Type::OTHER;
    }
}

void setPlace(Event& event, int x, int y, float scale)
{
    event.x = (float(x) + 0.5f) * scale;
    event.y = (float(y) + 0.5f) * scale;
}

Event translate(const SDL_Event& native, float scale)
{
    Event event;
    switch (native.type)
    {
    case SDL_QUIT: event.type = Event::Type::QUIT; break;
    case SDL_WINDOWEVENT: event.type = toType(native.window); break;
    case SDL_KEYDOWN:
        event.type = Event::Type::KEY;
        event.key = native.key.keysym.sym;
        break;
    case SDL_MOUSEBUTTONDOWN:
    case SDL_MOUSEBUTTONUP:
        event.type = native.type == SDL_MOUSEBUTTONDOWN ? Event::Type::PRESS : Event::Type::RELEASE;
        event.button = toButton(native.button.button);
        event.clicks = native.button.clicks;
        setPlace(event, native.button.x, native.button.y, scale);
        break;
    case SDL_MOUSEMOTION:
        event.type = Event::Type::MOVE;
        setPlace(event, native.motion.x, native.motion.y, scale);
        break;
    case SDL_MOUSEWHEEL:
        event.type = Event::Type::WHEEL;
        event.turns =
            native.wheel.preciseY * (native.wheel.direction == SDL_MOUSEWHEEL_FLIPPED ? -1.0f : 1.0f);
        break;
    case SDL_DROPFILE:
        event.type = Event::Type::DROP;
        event.path = native.drop.file ? native.drop.file : "";
        SDL_free(native.drop.file); // the receiver's
        break;
    default: break;
    }
    return event;
}

} // namespace

std::unique_ptr<Window> Window::create(const Options& options, std::string& error)
{
    SDL_SetHint(SDL_HINT_OPENGL_ES_DRIVER, "1"); // EGL, from which the engine gets entry points
    SDL_SetHint(SDL_HINT_VIDEO_X11_NET_WM_BYPASS_COMPOSITOR, "0");
    auto native = std::make_unique<Native>();
    const bool isReady = SDL_Init(SDL_INIT_VIDEO) == 0;
    if (isReady && !isVisible())
        SDL_SetError("there is no screen");
    else if (isReady && (native->open(options, options.samples) || native->open(options, 0)))
    {
        SDL_GL_SetSwapInterval(1);
        return std::unique_ptr<Window>(new Window(std::move(native)));
    }
    error = SDL_GetError();
    return nullptr;
}

Window::Window(std::unique_ptr<Native> native) : m_native(std::move(native)) {}

Window::~Window() = default;

int Window::getWidth() const
{
    int width = 0;
    SDL_GL_GetDrawableSize(m_native->window, &width, nullptr);
    return width;
}

int Window::getHeight() const
{
    int height = 0;
    SDL_GL_GetDrawableSize(m_native->window, nullptr, &height);
    return height;
}

float Window::getScale() const
{
    int units = 0;
    SDL_GetWindowSize(m_native->window, &units, nullptr);
    return units > 0 ? float(getWidth()) / float(units) : 1.0f;
}

void Window::setTitle(const std::string& title)
{
    SDL_SetWindowTitle(m_native->window, title.c_str());
}

void Window::setFullScreen(bool isFull)
{
    SDL_SetWindowFullscreen(m_native->window, isFull ? SDL_WINDOW_FULLSCREEN_DESKTOP : 0);
}

bool Window::isFullScreen() const
{
    return (SDL_GetWindowFlags(m_native->window) & SDL_WINDOW_FULLSCREEN_DESKTOP) != 0;
}

Event Window::take(const void* nativeEvent)
{
    const auto& native = *static_cast<const SDL_Event*>(nativeEvent);
    if (native.type == SDL_KEYDOWN || native.type == SDL_KEYUP)
        m_native->shift = (native.key.keysym.mod & KMOD_SHIFT) != 0;
    Event event = translate(native, getScale());
    event.shift = m_native->shift;
    return event;
}

bool Window::poll(Event& event)
{
    SDL_Event native;
    if (!SDL_PollEvent(&native))
        return false;
    event = take(&native);
    return true;
}

bool Window::wait(Event& event, int milliseconds)
{
    SDL_Event native;
    if (!SDL_WaitEventTimeout(&native, milliseconds))
        return false;
    event = take(&native);
    return true;
}

void Window::show()
{
    SDL_GL_SwapWindow(m_native->window);
}

} // namespace window
