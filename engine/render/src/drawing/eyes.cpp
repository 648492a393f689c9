#include "eyes.h"

#include "orv/camera.h"
#include "orv/rendercontext.h"

namespace orv::detail
{

int findEyes(Camera* camera, float aspect, Eye (&eyes)[2])
{
    if (!camera)
        return 1;
    if (camera->getStereoEyeSeparation() != 0.0f)
    {
        camera->getStereoProjection(&eyes[0].projection, &eyes[1].projection, aspect);
        camera->getStereoWorldTransform(&eyes[0].world, &eyes[1].world);
        return 2;
    }
    camera->getProjection(&eyes[0].projection, aspect);
    eyes[0].world = camera->getWorldTransform();
    return 1;
}

MirroredView::MirroredView(RenderContext& context, const Camera* camera)
    : m_context(context)
    , m_before(context.isViewMirrored())
{
    context.setViewMirrored(camera && camera->getWorldMirrored());
}

MirroredView::~MirroredView()
{
    m_context.setViewMirrored(m_before);
}

Viewport getViewport(const RenderContext& context)
{
    return {context.getViewportX(), context.getViewportY(), context.getViewportWidth(),
            context.getViewportHeight()};
}

void setViewport(RenderContext& context, const Viewport& viewport)
{
    context.setViewport(viewport.x, viewport.y, viewport.width, viewport.height);
}

float getAspect(const Viewport& viewport)
{
    if (viewport.width <= 0 || viewport.height <= 0)
        return 1.0f;
    return static_cast<float>(viewport.width) / static_cast<float>(viewport.height);
}

Viewport getHalf(const Viewport& viewport, int eye)
{
    const int width = viewport.width / 2;
    return {viewport.x + eye * width, viewport.y, width, viewport.height};
}

} // namespace orv::detail
