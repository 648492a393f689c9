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
/// render() draws into a texture how far away from the light is what it meets first, which the materials that attach() has
/// changed look up. Everything opaque throws shadows, skinned solids as they stand at the moment, and cut-out ones
/// (CUTOFF) with their holes. The sides of a solid that are not drawn (RenderState::cullingMode) let light through; so
/// does what is blended, and mirrors do.
///
/// A device without what it takes (highp in fragment shaders, a texture to draw into), or a scene without such a light, has
/// the frames without shadows, and one message says why.
/// A context has the shadows of one light at a time: those that were rendered last.
/// A lost context takes the shadows along: drop them with the scene and make others.
/// Threads: the GL thread only, the last release included.
class ORV_API ShadowMap : public Shared
{
public:
    ORV_CLASS_NAME("ShadowMap")
    using Ptr = SharedPtr<ShadowMap>;

    /// @param context  shared; must not be empty.
    /// @param pool     shared; must not be empty. It learns of the programs for shadows, called "shadow#...".
    /// @param size     texels along each side of the map, 16 to 8192: more are finer. Four bytes each, and two for depths.
    ShadowMap(const SharedPtr<RenderContext>& context, const SharedPtr<AssetCachePool>& pool,
              int size = 1024);
    /// Detaches.
    ~ShadowMap() override;

    /// False, after a message, if the device cannot have shadows: then nothing here has an effect.
    bool isComplete() const;

    /// Gives materials of a scene programs with which they take shadows: those that have orv#max_pvl.sp or orv#max_ppl.sp
    /// with DIFF or SPEC. Others stay as they are, and so do those whose programs leave no room, which is logged once:
    /// max_ppl with all of BUMP, DIFF, SPEC, AMBI, REFL and EMIS (eight textures) and, on the smallest devices, max_ppl with
    /// DIFF, SPEC and EMIS and max_pvl with DIFF, AMBI, REFL, LINEAR and SKIN. Solids that come later need another call.
    /// @return how many materials of the scene take shadows now, own programs that bind S_DEPTHS among them.
    int attach(SceneNode& scene);

    /// Gives all materials their programs back, but for those that have others by now.
    void detach();

    /// @param light  directional or spot, and among the first five lights of the scene; empty, as at first: the first such
    ///               light that render() comes across.
    void setLight(const SharedPtr<Light>& light);

    /// Which solids throw shadows, by their own flags and those above; at first all. A sky around everything is better left
    /// out: it would make a directional light's map as wide as itself.
    void setThrowers(const FlagMask& flags);

    /// How far from the eye a directional light's shadows reach at least, world units; 0, as at first: as far as the camera
    /// sees. Where all that throws shadows is in less room than that, the map holds all of it and is finer.
    void setDistance(float distance);

    /// Draws the map, for the next frames; before the blocks that show the scene. Framebuffer and viewport come back.
    ///
    /// Of solids whose bounds are not known (see SimpleRenderer::setCulled()) it is not known how far they reach either: a
    /// directional light's map then covers what is within the distance.
    /// @param camera  borrowed: what it sees is where a directional light's shadows have to be. Null: everywhere.
    /// @param renderFlags, recursiveFlags  which nodes take part; the block's, so that lights are counted alike.
    void render(SceneNode& scene, Camera* camera, const FlagMask& renderFlags = FlagMask(),
                const FlagMask& recursiveFlags = FlagMask());

private:
    std::unique_ptr<detail::ShadowParts> m_parts;
};

} // namespace orv
