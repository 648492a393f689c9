#pragma once

#include "orv/colour.h"
#include "orv/detail/drawmark.h"
#include "orv/export.h"
#include "orv/renderstate.h"
#include "orv/shaderprogram.h"
#include "orv/shaderuniform.h"
#include "orv/sharedptr.h"

#include <cstdint>
#include <map>
#include <string>
#include <vector>

namespace orv
{

class AssetCachePool;
class PropertyCollector;
class RenderContext;

/// A material: a shader program, the whole fixed-function render state that goes with it, and named values,
/// called properties, that feed the program's uniforms of the same property name.
///
/// GL thread only, once it is drawn with.
class ORV_API Appearance : public Shared
{
public:
    using Ptr = SharedPtr<Appearance>;

    ORV_CLASS_NAME("Appearance")

    /// Opaque, depth test LESS, depth write on, back faces culled, counter-clockwise front faces; no program and
    /// no properties.
    Appearance();
    ~Appearance() override;

    const char* getName() const { return m_name.c_str(); } ///< For messages; empty at first.
    void setName(const char* name);                        ///< copied; null counts as empty

    /// The render state as it was set. Each setter below stores its arguments; the next enable() sends them. What
    /// GL would refuse (a line width that is not above 0, a negative width or height, a depth offset of NaN) is
    /// logged and not stored.
    const RenderState& getRenderState() const { return m_state; }

    /// What render state it is drawn with; see RenderState for what each means and how it starts.
    void setBlendColour(const Colour4f& colour);
    void setBlendFactors(BlendFactor srcColour, BlendFactor srcAlpha, BlendFactor dstColour,
                         BlendFactor dstAlpha);
    void setBlendFunctions(BlendFunction colour, BlendFunction alpha);
    void setCullingMode(CullingMode mode);
    void setWindingOrder(WindingOrder order); ///< which winding is front-facing, in the model's own space
    void setLineWidth(float width);
    void setColourMask(bool red, bool green, bool blue, bool alpha);
    void setDepthWriteEnabled(bool enabled);
    void setDepthOffset(float factor, float units);
    void setDepthTestEnabled(bool enabled);
    void setDepthTestFunction(DepthFunction function);
    void setScissorTestEnabled(bool enabled);
    void setScissorBox(int x, int y, int width, int height);
    void setStencilTestEnabled(bool enabled);

    /// @param mask  stored but never sent: the compare mask that is sent is the face's write mask.
    void setStencilFunction(StencilFace face, StencilFunction function, int reference, unsigned int mask);
    /// What becomes of the stencil value in each case.
    void setStencilOperations(StencilFace face, StencilOperation stencilFail, StencilOperation depthFail,
                              StencilOperation pass);
    void setStencilMask(StencilFace face, unsigned int mask); ///< the face's write mask

    /// Whether the blend factors and functions are the default ones, or opacity is forced. Blending is switched
    /// on exactly for an appearance that is not opaque; renderers draw it after the opaque ones, back to front.
    bool isOpaque() const { return m_opaque; }

    /// Treats the appearance as opaque whatever its blend factors and functions say.
    void setForceOpaque(bool force);

    /// The program that draws it; may be empty.
    const SharedPtr<ShaderProgram>& getShaderProgram() const { return m_shaderProgram; }
    void setShaderProgram(const SharedPtr<ShaderProgram>& program);

    /// Creates a property of zeroed elements, or replaces the one of that name; those that hold the old one keep
    /// it, detached. T is normally one of bool, int, float, Vector2f, Vector3f, Vector4f, SharedPtr<Texture2D>
    /// and SharedPtr<TextureCube>; colours are Vector4f.
    /// @param size  count of elements; below 1 is an error and changes nothing.
    template <class T>
    void addProperty(const char* name, int size)
    {
        if (sizeAllowed(size))
            storeProperty(name, makeShared<ShaderUniform<T>>(size));
    }

    /// Sets one element, creating a property of index + 1 elements when there is none of that name (with a
    /// warning unless index is 0). An existing property never grows and never changes its type.
    /// @return whether the element was stored.
    template <class T>
    bool setProperty(const char* name, const T& value, int index = 0)
    {
        if (!indexAllowed(name, index))
            return false;
        if (!propertyExists(name))
            addProperty<T>(name, int(unsigned(index) + 1u)); // the last index has no size
        const SharedPtr<ShaderUniformBase>& uniform = getPropertyUniform(name);
        return uniform && uniform->setValue(value, index);
    }

    /// The property's value holder; when there is none of that name, one and the same null pointer. The reference
    /// holds until the property is replaced or the appearance is gone.
    const SharedPtr<ShaderUniformBase>& getPropertyUniform(const char* name) const;
    bool propertyExists(const char* name) const;

    /// Changes whenever a property is added or replaced; never the same for two appearances.
    uint64_t getPropertyRevision() const { return m_propertyRevision; }

    /// Hands every property to the collector, in the order of their names, until it answers false.
    void collectProperties(PropertyCollector* collector) const;

    /// Finds for each property the uniform of the program that asks for it; done once until the program or the
    /// set of properties changes. enable() calls it.
    void linkShaderProgram();

    /// Hands every linked property to the program, and takes them back. enable() has a shorter way to the same.
    void applyProperties();
    void resetProperties();

    /// Makes the program current, fed from this appearance; nothing without a program. Draw path.
    void enableShaderProgram(RenderContext& context);

    /// Sends the render state and enables the program. Draw path.
    /// @param turnWinding  turns the winding order, for a solid whose world transform mirrors it.
    void enable(RenderContext& context, bool turnWinding = false);

    /// The same without the transforms that a renderer sends for each draw; see ShaderProgram::prepare().
    /// @return where the program's uniforms take their values from, until the appearance or the program changes; null
    /// without a live program.
    const detail::UniformSources* prepare(RenderContext& context, bool turnWinding);

    /// Reads an appearance file into this appearance, overriding only what the file mentions. Problems are
    /// logged; what was read before one stays. The format is described at loadAppearance().
    void apply(AssetCachePool& pool, const char* name);

    detail::DrawMark& getDrawMark() const { return m_drawMark; } ///< the renderer's

private:
    struct Property
    {
        SharedPtr<ShaderUniformBase> uniform;
        int32_t uniformIndex = -1; ///< -1: no uniform of the program asks for it
    };

    static bool sizeAllowed(int size);
    ORV_LOCAL static bool faceAllowed(StencilFace face);
    bool indexAllowed(const char* name, int index) const;
    void storeProperty(const char* name, const SharedPtr<ShaderUniformBase>& uniform);
    void stateChanged();
    ORV_LOCAL const detail::UniformSources* applyAndPrepare(RenderContext& context, bool turnWinding);

    std::string m_name;
    SharedPtr<ShaderProgram> m_shaderProgram;
    std::map<std::string, Property, std::less<>> m_properties;
    /// Once linked, for each uniform of the program its property or null.
    std::vector<const ShaderUniformBase*> m_values;
    detail::UniformSources m_sources;
    RenderState m_state;
    uint64_t m_stateRevision;
    uint64_t m_propertyRevision;
    mutable detail::DrawMark m_drawMark;
    bool m_linked = false;
    bool m_forceOpaque = false;
    bool m_opaque = true;
};

/// Makes an appearance from an appearance file.
///
/// The file is text: "1.0", then statements, each a word and its arguments, separated by white space; a token in
/// double quotes may hold blanks, and "//" where a statement could start begins a comment to the end of the line.
///
///     1.0
///     shader_program orv#max_pvl.sp$DIFF
///     property M_DIFFUSE_TEXTURE Texture2D wood.png
///     culling_mode NONE
///
/// Statements: shader_program, property, polygon_mode (culling, winding, line width), culling_mode, winding_order,
/// line_width, depth_offset, depth_test, depth_function, depth_write, colour_mask, blend_colour, blend_factors,
/// blend_functions, stencil_function, stencil_operations, stencil_mask and stencil_write_mask (the same). Types of
/// properties: Texture2D, TextureCube, Colour4f, Vector4f, Vector3f, Vector2f, float, int, bool; the value goes to
/// element 0.
/// @return never null; the default appearance when the file is missing (logged).
ORV_API SharedPtr<Appearance> loadAppearance(AssetCachePool& pool, const char* name);

} // namespace orv
