#pragma once

#include "orv/export.h"
#include "orv/flagmask.h"
#include "orv/shared.h"
#include "orv/sharedptr.h"

#include <memory>

namespace orv
{

class AssetCachePool;
class Camera;
class Light;
class RenderContext;
class SceneNode;

namespace detail
{
struct ShadowParts;
} // namespace detail

/// Shadows of one directional or spot light, with soft edges.
///
///     const auto shadows = makeShared<ShadowMap>(context, pool);
///     shadows->attach(*scene);
///     ...                                      // each frame
///     shadows->render(*scene, camera.get());
///     block->render();
///
/// render() draws the distances from the light to the nearest surfaces into a texture, which the materials changed by
/// attach() look up. All opaque solids cast shadows, skinned ones in their current pose, cut-outs (CUTOFF) with their
/// holes. Culled sides (RenderState::cullingMode), blended solids, mirrors, and solids whose programs take no transform
/// (such as a picture behind the scene) cast none.
///
/// If the device lacks something (highp in fragment shaders, a texture to draw into), or the scene has no such light,
/// frames have no shadows, and one message says why. A context has the shadows of one light at a time: those rendered
/// last. After a lost context, drop the object with the scene and make a new one. Threads: the GL thread only, the last
/// release included.
class ORV_API ShadowMap : public Shared
{
public:
    ORV_CLASS_NAME("ShadowMap")
    using Ptr = SharedPtr<ShadowMap>;

    /// @param context  shared; must not be empty.
    /// @param pool     shared; must not be empty. The programs for shadows, "shadow#...", are registered there.
    /// @param size     texels along each side of the map, 16 to 8192. Each takes four bytes, and two for depth.
    ShadowMap(const SharedPtr<RenderContext>& context, const SharedPtr<AssetCachePool>& pool,
              int size = 1024);
    /// Detaches.
    ~ShadowMap() override;

    /// False, after a message, if the device cannot have shadows: then nothing here has an effect.
    bool isComplete() const;

    /// Gives the materials of a scene programs that receive shadows: those with orv#max_pvl.sp or orv#max_ppl.sp and
    /// DIFF or SPEC. Other materials are unchanged. So are those whose programs have no room for it, which is logged
    /// once: max_ppl with all of BUMP, DIFF, SPEC, AMBI, REFL and EMIS (eight textures) and, on the smallest devices,
    /// max_ppl with DIFF, SPEC and EMIS and max_pvl with DIFF, AMBI, REFL, LINEAR and SKIN. Call it again after adding
    /// solids.
    /// @return how many materials of the scene receive shadows now, including programs of your own that bind S_DEPTHS.
    int attach(SceneNode& scene);

    /// Restores the programs of all materials, except those whose program was changed in the meantime, or
    /// that another map is attached to.
    void detach();

    /// @param light  directional or spot, and among the first five lights of the scene; empty (the default): the first
    ///               such light that render() finds.
    void setLight(const SharedPtr<Light>& light);

    /// Which solids cast shadows, by their own flags and those above; by default all. Leave out a sky around the scene:
    /// a directional light's map would cover all of it.
    void setThrowers(const FlagMask& flags);

    /// The least distance from the eye at which a directional light's shadows are visible, world units; 0 (the
    /// default): the camera's far distance. If all casters take less space than that, the map covers just them and is
    /// finer.
    void setDistance(float distance);

    /// Draws the map for the next frames. Call it before the blocks that show the scene. Restores framebuffer and
    /// viewport.
    ///
    /// If the bounds of some solids are unknown (see SimpleRenderer::setCulled()), a directional light's map covers
    /// everything within the distance.
    /// @param camera  borrowed: a directional light's map covers its view. Null: the whole scene. The aspect
    ///                ratio is that of the context's viewport: set it first if the block has its own.
    /// @param renderFlags, recursiveFlags  which nodes take part; use the block's, so that lights are counted alike.
    void render(SceneNode& scene, Camera* camera, const FlagMask& renderFlags = FlagMask(),
                const FlagMask& recursiveFlags = FlagMask());

private:
    std::unique_ptr<detail::ShadowParts> m_parts;
};

} // namespace orv
