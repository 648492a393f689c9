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

Viewport getViewport(const RenderContext& context);
void setViewport(RenderContext& context, const Viewport& viewport);

/// Width / height, 1 for an empty viewport.
float getAspect(const Viewport& viewport);

/// The half that an eye (0 left, 1 right) draws to in stereo.
Viewport getHalf(const Viewport& viewport, int eye);

} // namespace detail
} // namespace orv
