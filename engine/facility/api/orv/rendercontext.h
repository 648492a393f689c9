#pragma once

#include "orv/detail/bindings.h"
#include "orv/detail/contextproperties.h"
#include "orv/export.h"
#include "orv/renderstate.h"
#include "orv/shared.h"
#include "orv/sharedptr.h"

#include <cstdint>

namespace orv
{

class ShaderUniformBase;

/// The owner of one GL context's fixed-function state and of its global shader properties.
///
/// Every setter compares with a cached copy and calls GL only when something differs. The cache starts with
/// the defaults of a freshly created context, so a RenderContext is made once, on a fresh GL context, and
/// after a context loss a new one is made for the new context. State changed behind its back stays unnoticed;
/// bindings (textures, buffers, programs) are the exception, see detail/bindings.h.
/// An enum value outside its enum is logged, cached, and sent as GL_INVALID_ENUM, which GL refuses. A line width
/// that is not above 0, a negative width or height, and NaN for a depth are logged, and the old value stays.
/// GL thread only.
class ORV_API RenderContext : public Shared
{
public:
    using Ptr = SharedPtr<RenderContext>;

    ORV_CLASS_NAME("RenderContext")

    /// While one exists, the context remembers from draw to draw what is bound, and binds only what differs.
    ///
    /// Without one, every draw binds everything it needs, whatever the application has bound. Renderers and
    /// render blocks open one for each frame; open one around many direct draws (Solid::draw(),
    /// Text::draw()). After GL calls of your own inside one, call forgetBindings().
    ///
    /// Scopes may be nested. At the start of each, what is bound counts as unknown. At the end of each, if
    /// anything was drawn, no vertex array is enabled, no vertex or index buffer is bound and texture unit 0
    /// is active; the program stays current and textures stay bound.
    class ORV_API DrawScope
    {
    public:
        /// @param context  borrowed until the end.
        explicit DrawScope(RenderContext& context);
        ~DrawScope();
        DrawScope(const DrawScope&) = delete;
        DrawScope& operator=(const DrawScope&) = delete;

    private:
        RenderContext& m_context;
    };

    /// Reads the scissor box and the viewport from GL and changes nothing there.
    RenderContext();
    ~RenderContext() override;

    void setBlendEnabled(bool enabled); ///< See RenderState; what GL has already is not sent again.
    void setBlendColour(const Colour4f& colour);
    /// Both sources first, unlike glBlendFuncSeparate.
    void setBlendFactors(BlendFactor srcColour, BlendFactor srcAlpha, BlendFactor dstColour,
                         BlendFactor dstAlpha);
    void setBlendFunctions(BlendFunction colour, BlendFunction alpha);
    void setCullingMode(CullingMode mode);
    void setWindingOrder(WindingOrder order);
    void setLineWidth(float pixels);
    void setColourMask(bool red, bool green, bool blue, bool alpha);
    void setDepthWriteEnabled(bool enabled);
    /// The offset that reaches GL lags one change behind: each change sends the values set before it, and the
    /// first one from (0, 0) switches the offset on with (0, 0). Setting (0, 0) switches it off at once.
    void setDepthOffset(float factor, float units);
    void setDepthTestEnabled(bool enabled);
    void setDepthTestFunction(DepthFunction function);
    void setScissorTestEnabled(bool enabled);
    void setScissorBox(int x, int y, int width, int height);
    void setStencilTestEnabled(bool enabled);
    /// The stencil setters touch the given face alone. A face outside its enum is not cached.
    void setStencilFunction(StencilFace face, StencilFunction function, int reference, unsigned mask);
    void setStencilOperations(StencilFace face, StencilOperation stencilFail, StencilOperation depthFail,
                              StencilOperation pass);
    void setStencilMask(StencilFace face, unsigned mask);
    void setViewport(int x, int y, int width, int height);
    void setDepthRange(float zNear, float zFar);
    void setClearColour(const Colour4f& colour);
    void setClearDepth(float depth);
    void setClearStencil(int stencil);

    /// Clears colour, depth and stencil buffers together, every time; masks and scissor box apply as set.
    void clear();

    bool isBlendEnabled() const { return m_blendEnabled; } ///< What was sent last.
    /// All cached state that materials set. stencilFunctionMask holds what was sent to GL.
    const RenderState& getState() const { return m_state; }
    int getViewportX() const { return m_viewport[0]; }
    int getViewportY() const { return m_viewport[1]; }
    int getViewportWidth() const { return m_viewport[2]; }
    int getViewportHeight() const { return m_viewport[3]; }
    float getDepthRangeNear() const { return m_depthRange[0]; }
    float getDepthRangeFar() const { return m_depthRange[1]; }
    const Colour4f& getClearColour() const { return m_clearColour; }
    float getClearDepth() const { return m_clearDepth; }
    int getClearStencil() const { return m_clearStencil; }

    /// Adds a global property. A name that is there already keeps its first holder (logged); so does a
    /// missing property or name, which is not stored (logged).
    void addProperty(const SharedPtr<ShaderUniformBase>& property, const char* name);
    /// @return empty when there is no such property.
    SharedPtr<ShaderUniformBase> getProperty(const char* name) const;
    /// Makes uniform point to the holder that is stored under name; leaves it alone when there is none.
    void linkUniform(SharedPtr<ShaderUniformBase>& uniform, const char* name) const;

    /// Identity: no other render context of this process has or had it, so it may be remembered in place of
    /// a pointer.
    uint64_t getRevision() const { return m_revision; }
    /// Changes with every addProperty() that stores something.
    uint64_t getPropertyRevision() const { return m_properties.getRevision(); }

    /// Draw path: sends a material's whole state through the setters above, in their order.
    ///
    /// The stencil comparison mask that is sent is the state's write mask.
    /// @param stateRevision  revision of state: returns at once if it, blendEnabled and turnWinding are those of
    ///                       the last call, and no setter has changed anything since.
    /// @param turnWinding    sends the opposite winding order, for geometry that a transform mirrors.
    /// @return a revision for later calls: that of the state applied before if both states are equal, so that
    ///         materials with equal states share one.
    uint64_t apply(const RenderState& state, uint64_t stateRevision, bool blendEnabled,
                   bool turnWinding = false)
    {
        if (!isApplied(stateRevision, blendEnabled, turnWinding))
            applyChanged(state, stateRevision, getApplyFlags(blendEnabled, turnWinding));
        return m_appliedRevision;
    }

    /// Whether apply() with these has nothing to do.
    bool isApplied(uint64_t stateRevision, bool blendEnabled, bool turnWinding) const
    {
        return stateRevision == m_appliedRevision &&
               getApplyFlags(blendEnabled, turnWinding) == m_appliedFlags;
    }

    /// Call this inside a DrawScope after GL calls of your own that bound or unbound a program, a buffer or a
    /// texture, or that changed the active texture unit or vertex attributes. Makes no GL call.
    void forgetBindings() { m_bindings.forget(); }

    bool isDrawScopeOpen() const { return m_bindings.isScopeOpen(); } ///< Whether a draw scope is open.

    /// Whether apply() turns every winding order once more, for a view that mirrors everything. Renderers set it
    /// for cameras whose world transform mirrors, and put it back.
    bool isViewMirrored() const { return m_viewTurns != 0; }
    void setViewMirrored(bool mirrored) { m_viewTurns = mirrored ? APPLY_TURNED : 0; }

    /// What the engine has bound through this context.
    detail::Bindings& getBindings() { return m_bindings; }
    const detail::Bindings& getBindings() const { return m_bindings; }

private:
    static constexpr uint32_t APPLY_BLEND = 1; ///< bits of m_appliedFlags
    static constexpr uint32_t APPLY_TURNED = 2;

    uint32_t getApplyFlags(bool blendEnabled, bool turnWinding) const
    {
        return ((blendEnabled ? APPLY_BLEND : 0u) | (turnWinding ? APPLY_TURNED : 0u)) ^ m_viewTurns;
    }

    void applyChanged(const RenderState& state, uint64_t stateRevision, uint32_t flags);
    void stateChanged() { m_appliedRevision = 0; }

    ORV_LOCAL static unsigned glBlendFactorConvert(BlendFactor factor);
    ORV_LOCAL static unsigned glBlendFunctionConvert(BlendFunction function);
    ORV_LOCAL static unsigned glCullingModeConvert(CullingMode mode);
    ORV_LOCAL static unsigned glWindingOrderConvert(WindingOrder order);
    ORV_LOCAL static unsigned glDepthFunctionConvert(DepthFunction function);
    ORV_LOCAL static unsigned glStencilFaceConvert(StencilFace face);
    ORV_LOCAL static unsigned glStencilFunctionConvert(StencilFunction function);
    ORV_LOCAL static unsigned glStencilOperationConvert(StencilOperation operation);

    detail::ContextProperties m_properties;
    detail::Bindings m_bindings;
    bool m_blendEnabled = false;
    RenderState m_state;
    float m_depthRange[2] = {0.0f, 1.0f};
    int m_viewport[4] = {0, 0, 0, 0};
    Colour4f m_clearColour;
    float m_clearDepth = 1.0f;
    int m_clearStencil = 0;

    uint64_t m_revision;
    uint64_t m_appliedRevision = 0;
    uint32_t m_appliedFlags = 0;
    uint32_t m_viewTurns = 0;   ///< APPLY_TURNED, or 0
    RenderState m_appliedState; ///< as it was given, before masks and winding order were chosen
};

/// The same for the back face and then the front face, each only when it differs.
ORV_API void setStencilFunction(RenderContext& context, StencilFunction function, int reference,
                                unsigned mask);
ORV_API void setStencilOperations(RenderContext& context, StencilOperation stencilFail,
                                  StencilOperation depthFail, StencilOperation pass);
ORV_API void setStencilMask(RenderContext& context, unsigned mask);

} // namespace orv
