#include "orv/renderblock.h"

#include "orv/camera.h"
#include "orv/rendercontext.h"
#include "orv/renderer.h"
#include "orv/rendertarget.h"
#include "orv/scenenode.h"
#include "orv/texture2d.h"

namespace orv
{

RenderBlock::RenderBlock(const SharedPtr<Renderer>& renderer, const SharedPtr<SceneNode>& scene,
                         const SharedPtr<Camera>& camera)
    : m_renderer(renderer)
    , m_scene(scene)
    , m_camera(camera)
{
    if (!m_renderer || !m_renderer->getRenderContext())
        return;
    const RenderContext& context = *m_renderer->getRenderContext();
    m_viewport = {context.getViewportX(), context.getViewportY(), context.getViewportWidth(),
                  context.getViewportHeight()};
}

RenderBlock::~RenderBlock() = default;

void RenderBlock::setCamera(const SharedPtr<Camera>& camera)
{
    m_camera = camera;
}

void RenderBlock::setRenderTarget(const SharedPtr<RenderTarget>& target)
{
    m_renderTarget = target;
}

void RenderBlock::setRenderFlags(const FlagMask& renderFlags, const FlagMask& recursiveFlags)
{
    m_renderFlags = renderFlags;
    m_recursiveFlags = recursiveFlags;
}

void RenderBlock::setRenderFlags(const FlagMask& flags)
{
    setRenderFlags(flags, flags);
}

void RenderBlock::setViewport(int x, int y, int width, int height)
{
    if (!detail::allowSize("Viewport", width, height))
        return;
    m_viewport = {x, y, width, height};
    m_viewportIsOwn = true;
}

void RenderBlock::setColourClear(bool enabled)
{
    m_background.setColourMask(enabled, enabled, enabled, enabled);
}

void RenderBlock::setDepthClear(bool enabled)
{
    m_background.setDepthMask(enabled);
}

void RenderBlock::setStereo(float focalDistance, float eyeSeparation)
{
    if (m_camera)
        m_camera->setStereo(focalDistance, eyeSeparation);
}

void RenderBlock::update(float time)
{
    if (m_renderer)
        m_renderer->update(time);
}

void RenderBlock::render()
{
    if (!m_renderer || !m_renderer->getRenderContext())
        return;
    RenderContext& context = *m_renderer->getRenderContext();

    if (m_renderTarget)
        m_renderTarget->enable();
    const detail::Viewport viewport = findViewport();
    context.setViewport(viewport.x, viewport.y, viewport.width, viewport.height);
    m_background.enable(context);
    if (m_scene)
    {
        const RenderContext::DrawScope scope(context); // for renderers of the application's own
        m_renderer->render(m_camera.get(), *m_scene, m_renderFlags, m_recursiveFlags);
    }
    if (m_renderTarget)
        m_renderTarget->disable();
}

detail::Viewport RenderBlock::findViewport() const
{
    if (m_viewportIsOwn || !m_renderTarget)
        return m_viewport;
    const Texture2D* texture = m_renderTarget->getColourTexture().get();
    if (!texture)
        texture = m_renderTarget->getDepthTexture().get();
    if (!texture)
        return m_viewport;
    return {0, 0, static_cast<int>(texture->getWidth()), static_cast<int>(texture->getHeight())};
}

} // namespace orv
