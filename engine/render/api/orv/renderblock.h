#pragma once

#include "orv/background.h"
#include "orv/detail/viewport.h"
#include "orv/flagmask.h"
#include "orv/shared.h"
#include "orv/sharedptr.h"

namespace orv
{

class Camera;
class Renderer;
class RenderTarget;
class SceneNode;

/// Something that can be rendered as one step of a frame: a block, or a group of them.
class ORV_API RenderBlockBase : public Shared
{
public:
    ORV_CLASS_NAME("RenderBlockBase")
    using Ptr = SharedPtr<RenderBlockBase>;

    virtual void render() = 0; ///< Draws it. GL thread only.
    /// @param time  absolute, in seconds.
    virtual void update(float time) = 0;
    /// Sets the stereo parameters of the cameras; see Camera::setStereo().
    virtual void setStereo(float focalDistance, float eyeSeparation) = 0;

    /// Whether rendering this renders other: true for itself, for a group also for its members' members. A class
    /// that holds further blocks asks them.
    virtual bool contains(const RenderBlockBase& other) const { return this == &other; }
};

/// One view of a scene: a renderer, the scene, a camera, where to draw, and what to clear first.
///
/// A block clears all of its surface or target, beyond its viewport too. One that shares the surface with others
/// says so: getBackground().setViewportOnly(true).
class ORV_API RenderBlock : public RenderBlockBase
{
public:
    ORV_CLASS_NAME("RenderBlock")
    using Ptr = SharedPtr<RenderBlock>;

    /// All three are shared and may be empty: without a renderer nothing is done, without a scene the view is
    /// only cleared, without a camera view and projection are the identity.
    RenderBlock(const SharedPtr<Renderer>& renderer, const SharedPtr<SceneNode>& scene,
                const SharedPtr<Camera>& camera);
    ~RenderBlock() override;

    /// What it looks through; may be empty.
    const SharedPtr<Camera>& getCamera() const { return m_camera; }
    void setCamera(const SharedPtr<Camera>& camera);
    /// What it draws into; empty for the current surface.
    const SharedPtr<RenderTarget>& getRenderTarget() const { return m_renderTarget; }
    /// @param target  empty draws to the current surface.
    void setRenderTarget(const SharedPtr<RenderTarget>& target);

    /// See visitScene(); both mean no flag at first, so that everything is drawn.
    void setRenderFlags(const FlagMask& renderFlags, const FlagMask& recursiveFlags);
    /// The same mask for both, for flags that a node hands down to all below it: SceneNode::VISIBLE, or the layers
    /// of docs/guide.md.
    void setRenderFlags(const FlagMask& flags);

    /// In pixels, from the lower left. Until this is called a block draws to the whole of its render target
    /// or, without one, to the viewport that the render context had when the block was made. Negative sizes are
    /// refused (logged).
    void setViewport(int x, int y, int width, int height);

    Background& getBackground() { return m_background; } ///< What is cleared, and to what.
    void setBackgroundColour(const Colour4f& colour) { m_background.setColour(colour); }
    void setColourClear(bool enabled); ///< false keeps the colours that are there
    void setDepthClear(bool enabled);  ///< false keeps the depths that are there

    /// Sets the camera's stereo parameters; see Camera::setStereo().
    void setStereo(float focalDistance, float eyeSeparation) override;

    /// Hands the time to the renderer.
    void update(float time) override;

    /// GL thread only. A render target is disabled afterwards, which leaves framebuffer 0 bound.
    void render() override;

private:
    ORV_LOCAL detail::Viewport findViewport() const;

    SharedPtr<Renderer> m_renderer;
    SharedPtr<SceneNode> m_scene;
    SharedPtr<Camera> m_camera;
    SharedPtr<RenderTarget> m_renderTarget;
    FlagMask m_renderFlags;
    FlagMask m_recursiveFlags;
    Background m_background;
    detail::Viewport m_viewport;
    bool m_viewportIsOwn = false;
};

} // namespace orv
