#pragma once

#include "orv/detail/viewport.h"
#include "orv/matrix.h"

namespace orv
{

class Camera;
class RenderContext;

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
int findEyes(Camera* camera, float aspect, Eye (&eyes)[2]);

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

Viewport getViewport(const RenderContext& context);
void setViewport(RenderContext& context, const Viewport& viewport);

/// Width / height, 1 for an empty viewport.
float getAspect(const Viewport& viewport);

/// The half that an eye (0 left, 1 right) draws to in stereo.
Viewport getHalf(const Viewport& viewport, int eye);

} // namespace detail
} // namespace orv
