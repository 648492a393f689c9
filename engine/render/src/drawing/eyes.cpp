#include "orv/detail/eyes.h"

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

} // namespace orv::detail
