#pragma once

namespace orv::detail
{

/// A rectangle of a framebuffer in pixels, from its lower left corner.
struct Viewport
{
    int x = 0;
    int y = 0;
    int width = 0;
    int height = 0;
};

} // namespace orv::detail
