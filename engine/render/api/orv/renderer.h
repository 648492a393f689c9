#pragma once

#include "orv/flagmask.h"
#include "orv/scenenodevisitor.h"
#include "orv/shared.h"
#include "orv/sharedptr.h"

namespace orv
{

class Camera;
class RenderContext;
class SceneNode;

/// Draws a scene from a camera into the current framebuffer and viewport.
class ORV_API Renderer : public Shared, public SceneNodeVisitor
{
public:
    ORV_CLASS_NAME("Renderer")
    using Ptr = SharedPtr<Renderer>;

    /// Draws one frame; what was drawn before is not cleared. GL thread only.
    /// @param camera  borrowed; null draws with identity view and projection.
    /// @param renderFlags, recursiveFlags  which nodes take part; see visitScene().
    virtual void render(Camera* camera, SceneNode& scene, const FlagMask& renderFlags,
                        const FlagMask& recursiveFlags) = 0;

    /// @param time  absolute, in seconds.
    virtual void update(float time) = 0;

    virtual const SharedPtr<RenderContext>& getRenderContext() const = 0; ///< What it draws with.
};

} // namespace orv
