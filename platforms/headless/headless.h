#pragma once

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

/// OpenGL ES 2.0 without a window, for tools, tests and benchmarks. Knows nothing of the engine.
namespace headless
{

struct Options
{
    int width = 64; ///< pixels, above 0
    int height = 64;
    int depthBits = 24; ///< at least this many, 0 for none
    int stencilBits = 8;
    int samples = 0; ///< per pixel, for smooth edges; none if the driver does not support them
};

/// A GL context with an off-screen surface (RGBA, 8 bits each) of its own.
///
/// It uses Mesa's surfaceless platform or, without that, the default display. Any number may exist at a time; they
/// share no objects. Threads: as EGL has it, a context is current on one thread at a time.
class Context
{
public:
    /// Makes a context and makes it current.
    /// @param error  set to the reason, one line, on failure.
    /// @return null on failure; the current context is unchanged then.
    static std::unique_ptr<Context> create(const Options& options, std::string& error);

    /// Deletes the GL objects with the context. If it was current, no context is current afterwards.
    ~Context();

    Context(const Context&) = delete;
    Context& operator=(const Context&) = delete;

    /// @return false, with the reason on standard error, if EGL refuses.
    bool makeCurrent();
    bool isCurrent() const;
    static void makeNoneCurrent();

    int getWidth() const { return m_width; }
    int getHeight() const { return m_height; }

    /// Waits for drawing and reads the surface; restores the bound framebuffer.
    /// @return width x height x 4 bytes RGBA, top row first; empty if the context is not current.
    std::vector<uint8_t> readPixels() const;

    /// Renderer and GL version, for a person to read.
    std::string describe() const;

private:
    Context() = default;

    void* m_display = nullptr;
    void* m_context = nullptr;
    void* m_surface = nullptr;
    int m_width = 0;
    int m_height = 0;
};

/// Reads the lower left of the current context's surface, whatever made it; see Context::readPixels().
std::vector<uint8_t> readSurface(int width, int height);

/// Reads from the bound framebuffer of the current context.
/// @param x,y  lower left corner, as GL counts.
/// @return width x height x 4 bytes RGBA, top row first.
std::vector<uint8_t> readFramebuffer(int x, int y, int width, int height);

} // namespace headless
