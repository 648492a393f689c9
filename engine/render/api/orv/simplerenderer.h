#pragma once

#include "orv/detail/framelist.h"
#include "orv/detail/viewport.h"
#include "orv/framecounters.h"
#include "orv/matrix.h"
#include "orv/renderer.h"

#include <memory>
#include <vector>

namespace orv
{

class Appearance;
class AssetCachePool;
class Light;
class PropertyRef;
class RenderTarget;

namespace detail
{
class Culling;
class DrawGroups;
struct Eye;
struct RendererProperties;
} // namespace detail

/// The forward renderer: opaque solids, then mirrors, then transparent solids back to front.
///
/// It feeds shaders through global properties of its render context, registered when it is made. Renderers on
/// one context share them; what is there already is used, not replaced.
///
/// - L_COUNT, and five elements each of L_DIFFUSE_COLOUR, L_AMBIENT_COLOUR, L_SPECULAR_COLOUR, L_POSITION
///   (w 0: a direction towards the light), L_ATTENUATION_NEAR, L_ATTENUATION_RECIPROCAL, L_SPOT_INNER_COS,
///   L_SPOT_OUTER_COS, L_SPOT_DIRECTION (against the light's shine). The first five lights of the walk count.
/// - J_COUNT and J_WORLD (20 matrices, mesh space to world space); J_WEIGHT_FILLED (1 where the mesh has fewer
///   than four weights a vertex, so that GL makes the last one 1).
/// - T_MODEL, T_VIEW, T_MODEL_VIEW, T_VIEW_PROJECTION, T_MODEL_VIEW_PROJECTION, T_NORMAL_MODEL (model space
///   normals to world space), T_CAMERA_POSITION.
/// - TIME, in seconds, wrapping at 60. FOG_DENSITY and FOG_COLOUR are the application's to set.
/// - M_BLACK_TEXTURE, M_WHITE_TEXTURE, M_ERROR_TEXTURE, and a default for each material value that an
///   appearance may leave out: M_DIFFUSE_COLOUR, M_SPECULAR_COLOUR (white), M_AMBIENT_COLOUR,
///   M_EMISSIVE_COLOUR (black), M_SHININESS (5), M_SPECULAR_LEVEL (1), M_OPACITY (1), M_SELF_ILLUMINATION
///   (0), M_UV_OFFSET_SCALE (0, 0, 1, 1), and white 2D textures M_DIFFUSE_TEXTURE, M_SPECULAR_TEXTURE,
///   M_AMBIENT_TEXTURE, M_EMISSIVE_TEXTURE, M_GLOSS_TEXTURE, M_SPECULAR_LEVEL_TEXTURE; a black
///   M_REFLECTION_TEXTURE, a M_BUMP_TEXTURE without bumps, and what the built-in effects take (docs/shaders.md).
///
/// Mirrors: a solid whose program takes M_MIRROR_TEXTURE lies in the plane through its position across its
/// z axis. Before it is drawn the opaque and transparent solids are drawn, reflected, into one texture that
/// all mirrors share; during that pass T_VIEW and T_CAMERA_POSITION are the reflected eye's. The picture is
/// upside down: a fragment at normalised device coordinates (x, y) finds its reflection at texture
/// coordinates (0.5 + 0.5 x, 0.5 - 0.5 y). It is cleared to the clear values last set (the render block's
/// background). The texture is made at the first mirror, as large as the surface where EGL knows that, else
/// as what lies to the left of and below the viewport's upper right corner; larger where the viewport of a render
/// target is; and again when the surface has another size, or a viewport has outgrown it. It is RGB. Solids behind the
/// mirror's plane are not cut away. Framebuffer and viewport come back.
///
/// The context is not to outlive its pool with the textures above in it: when the last renderer of a context
/// goes it takes them out of the context, so drop renderers before the last AssetCachePool::flush().
/// GL thread only.
class ORV_API SimpleRenderer : public Renderer
{
public:
    ORV_CLASS_NAME("SimpleRenderer")
    using Ptr = SharedPtr<SimpleRenderer>;

    /// @param context  shared; must not be empty.
    /// @param pool  shared; where the textures come from. Empty: there are none, and no mirrors.
    SimpleRenderer(const SharedPtr<RenderContext>& context, const SharedPtr<AssetCachePool>& pool);
    ~SimpleRenderer() override;

    /// A camera with a stereo eye separation draws twice, the left eye to the left half of the viewport.
    void render(Camera* camera, SceneNode& scene, const FlagMask& renderFlags,
                const FlagMask& recursiveFlags) override;
    void update(float time) override { m_time = time; }
    const SharedPtr<RenderContext>& getRenderContext() const override { return m_context; }

    /// Draws opaque solids grouped by program, then by material, then by mesh, instead of in the order of the
    /// walk; within a group they keep that order. Reflections are grouped too. Off by default.
    ///
    /// On most drivers, changing programs and textures takes most of the time of a frame with many solids.
    /// Pictures stay the same, except where two solids have equal depths. A solid keeps its place, after
    /// everything that comes before it in the walk, where its material's render state makes the order matter:
    /// depth test or write off, a depth function other than LESS and LEQUAL, a depth offset, the stencil
    /// test, a colour mask. Do not use it for targets without a depth buffer, nor for programs with uniforms
    /// that some of their materials give no value: those keep the last value sent.
    void setOpaqueGrouped(bool grouped);
    bool isOpaqueGrouped() const { return m_groups != nullptr; }

    /// Leaves out solids that are outside the view. Each eye in stereo and each mirror's picture is tested by
    /// itself; a subtree that is wholly outside costs one test. Off by default.
    ///
    /// A solid is tested by the sphere around its mesh (Mesh::getBounds()), a skinned one by spheres around
    /// what each joint moves (Mesh::getJointBounds()), so that nothing visible is left out. Solids of unknown
    /// bounds are always drawn, and so are points and those whose program takes no model transform. Bounds are known for
    /// the built-in shapes, for scene files loaded with MeshData::BOUNDS, and where Mesh::setBounds() set
    /// them; programs that move vertices need the latter. Pictures stay the same; the transform properties
    /// end up with the values of the last solid drawn.
    ///
    /// Subtrees that hold lights, skinned solids, solids of unknown bounds or anything that moves are tested
    /// solid by solid. A node class of your own whose accept() hands over other nodes than itself needs a
    /// getNodeType() of its own, so that its subtree is never left out as a whole.
    void setCulled(bool culled);
    bool isCulled() const { return m_culling != nullptr; }

    /// Counts what each frame takes, from the beginning of render() to its end. Off at first.
    void setCounted(bool counted);
    bool isCounted() const { return m_counters != nullptr; }
    /// Of the last frame that was counted; the render block's clearing is not in it.
    FrameCounters getCounters() const { return m_counters ? *m_counters : FrameCounters(); }

    /// The scene walk of render() arrives here.
    using SceneNodeVisitor::visit;
    void visit(Solid* solid) override;
    void visit(Light* light) override;

private:
    struct SortKey
    {
        float depth; ///< along the eye's z axis; never NaN
        Solid* solid;
    };

    ORV_LOCAL void drawFrame(Camera* camera, SceneNode& scene, const FlagMask& renderFlags,
                             const FlagMask& recursiveFlags);
    ORV_LOCAL void collect(SceneNode& scene, const FlagMask& renderFlags, const FlagMask& recursiveFlags);
    ORV_LOCAL detail::FrameList<Solid*>* findList(const Appearance* appearance);
    ORV_LOCAL void addToGroups(Solid* solid);
    ORV_LOCAL void publishLights();
    ORV_LOCAL void publishLight(const Light& light, int index);
    ORV_LOCAL void publishEye(const Matrix4f& world, const Matrix4f& view);
    ORV_LOCAL void sortTransparent(const Vector3f& eyeZ);
    ORV_LOCAL void renderEye(const detail::Eye& eye, const detail::Viewport& viewport);
    ORV_LOCAL bool prepareMirrorTarget();
    ORV_LOCAL void makeMirrorTarget(int width, int height);
    ORV_LOCAL void renderReflection(const Solid& mirror, const detail::Eye& eye,
                                    const detail::Viewport& viewport);
    void draw(Solid* const* solids, size_t count, const Matrix4f& view, const Matrix4f& projection);

    SharedPtr<RenderContext> m_context;
    SharedPtr<AssetCachePool> m_pool;
    std::unique_ptr<detail::RendererProperties> m_properties;
    detail::FrameList<Solid*> m_opaque; // these four are valid during render() only
    detail::FrameList<Solid*> m_transparent;
    detail::FrameList<Solid*> m_mirrors;
    std::vector<Light*> m_lights;
    std::vector<SortKey> m_sortKeys;
    std::unique_ptr<detail::DrawGroups> m_groups; // null where the walk's order counts
    std::unique_ptr<detail::Culling> m_culling;   // null where all is drawn
    std::unique_ptr<FrameCounters> m_counters;    // null where nothing is counted
    std::vector<PropertyRef> m_mirrorProperties;  // one for each place in m_mirrors
    detail::Viewport m_viewport;                  // of the whole picture
    SharedPtr<RenderTarget> m_mirrorTarget;
    int m_mirrorSurface[2] = {0, 0}; // the surface's size when the mirror's texture was made; 0 unknown
    int m_mirrorSize[2] = {0, 0};    // of the texture, had or refused
    float m_time = 0.0f;
};

} // namespace orv
