#pragma once

#include "orv/matrix.h"
#include "orv/renderer.h"

#include <memory>
#include <vector>

namespace orv
{

class Appearance;
class AssetCachePool;

namespace detail
{
struct UniformSources;
}

/// Draws how fast things move over the screen instead of what they look like: the picture that
/// "orv#motionblur.sp" blurs a sharp one with. docs/motionblur.md says how the two are put together and what
/// the colours mean.
///
/// Registers global properties of its render context when it is made, sharing what other renderers have there:
/// J_COUNT, J_WORLD, T_VIEW_PROJECTION, T_MODEL_VIEW_PROJECTION and TIME as SimpleRenderer has them;
/// T_OLD_MODEL_VIEW_PROJECTION, the same solid and eye in the frame before; DELTA_TIME, 1/60 s over the time
/// since the last render(), or 1 when no time has passed; and MOTION_BLUR_FACTOR, 0 until the application sets
/// it, the time for which the shutter is open in sixtieths of a second.
///
/// A frame is compared with the last one that this renderer drew, so use one renderer per camera and scene,
/// and render once per frame. The very first frame is compared with the identity: do not show it.
///
/// Solids with joints per vertex are drawn with an appearance that has no program, so with whatever program is
/// current and the values that it was last given; when none is, they are not drawn. Every other solid is drawn
/// by "orv#gen_velocity.sp$SKIN".
/// GL thread only.
class ORV_API MotionBlurRenderer : public Renderer
{
public:
    ORV_CLASS_NAME("MotionBlurRenderer")
    using Ptr = SharedPtr<MotionBlurRenderer>;

    /// @param context  shared; must not be empty.
    /// @param pool  shared; where the programs come from. Empty: there are none.
    MotionBlurRenderer(const SharedPtr<RenderContext>& context, const SharedPtr<AssetCachePool>& pool);
    ~MotionBlurRenderer() override;

    /// A camera with a stereo eye separation draws twice, the left eye to the left half of the viewport.
    /// Every solid that the flags let through then counts as having been where it is; the others still count
    /// as having been where they were when they last took part.
    void render(Camera* camera, SceneNode& scene, const FlagMask& renderFlags,
                const FlagMask& recursiveFlags) override;
    void update(float time) override { m_time = time; }
    const SharedPtr<RenderContext>& getRenderContext() const override { return m_context; }

    /// The scene walk of render() arrives here.
    using SceneNodeVisitor::visit;
    void visit(Solid* solid) override;

private:
    struct Properties;

    ORV_LOCAL void drawEye(const Matrix4f& viewProjection, const Matrix4f& lastViewProjection);
    ORV_LOCAL void drawReady(const Solid& solid, const detail::UniformSources& sources, const Matrix4f& now,
                             const Matrix4f& before);

    SharedPtr<RenderContext> m_context;
    SharedPtr<AssetCachePool> m_pool;
    std::unique_ptr<Properties> m_properties;
    std::vector<Solid*> m_solids; // valid during render() only
    float m_time = 0.0f;
    float m_lastTime = 0.0f;
    Matrix4f m_lastViewProjections[2] = {Matrix4f::IDENTITY, Matrix4f::IDENTITY}; // of each eye
    SharedPtr<Appearance> m_velocity;
    SharedPtr<Appearance> m_skinnedVelocity;
};

} // namespace orv
