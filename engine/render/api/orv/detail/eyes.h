#pragma once

#include "orv/detail/viewport.h"
#include "orv/export.h"
#include "orv/matrix.h"
#include "orv/rendercontext.h"

namespace orv
{

class Camera;

namespace detail
{

/// One picture's point of view.
struct Eye
{
    Matrix4f world = Matrix4f::IDENTITY;
    Matrix4f projection = Matrix4f::IDENTITY;
};

/// @param camera  may be null: one eye at the origin without projection.
/// @param aspect  width / height of the whole view.
/// @return 2 for a camera with an eye separation (left, right), else 1.
ORV_API int findEyes(Camera* camera, float aspect, Eye (&eyes)[2]);

/// While it lives, the context turns windings if the camera's world transform mirrors.
class MirroredView
{
public:
    /// @param camera  may be null, which mirrors nothing.
    MirroredView(RenderContext& context, const Camera* camera);
    ~MirroredView();
    MirroredView(const MirroredView&) = delete;
    MirroredView& operator=(const MirroredView&) = delete;

private:
    RenderContext& m_context;
    bool m_before;
};

inline Viewport getViewport(const RenderContext& context)
{
    return {context.getViewportX(), context.getViewportY(), context.getViewportWidth(),
            context.getViewportHeight()};
}

inline void setViewport(RenderContext& context, const Viewport& viewport)
{
    context.setViewport(viewport.x, viewport.y, viewport.width, viewport.height);
}

/// Width / height, 1 for an empty viewport.
inline float getAspect(const Viewport& viewport)
{
    if (viewport.width <= 0 || viewport.height <= 0)
        return 1.0f;
    return static_cast<float>(viewport.width) / static_cast<float>(viewport.height);
}

/// The half that an eye (0 left, 1 right) draws to in stereo.
inline Viewport getHalf(const Viewport& viewport, int eye)
{
    const int width = viewport.width / 2;
    return {viewport.x + eye * width, viewport.y, width, viewport.height};
}

} // namespace detail
} // namespace orv
