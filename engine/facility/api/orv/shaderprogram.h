#pragma once

#include "orv/detail/drawmark.h"
#include "orv/detail/programattrib.h"
#include "orv/detail/programhandle.h"
#include "orv/detail/uniformsources.h"
#include "orv/export.h"
#include "orv/shaderuniform.h"
#include "orv/sharedptr.h"

#include <cstddef>
#include <cstdint>
#include <string>
#include <vector>

namespace orv
{

class RenderContext;
class VertexBuffer;

namespace detail
{
class ProgramResource;
} // namespace detail

/// A linked GL program with what was learned about it when it was made: its active uniforms, each with a memory
/// of the values sent last, and its active vertex attributes. Made by ShaderProgramCache only.
///
/// A uniform takes its value from, first that is there: the values handed to enable(), the value set by
/// setUniformPropertyValue(), the property of the render context that has the uniform's property name. A uniform
/// with no source keeps what it has; a sampler with no texture reads texture name 0, which is black.
///
/// Vertex attribute locations are assumed to be consecutive from 0.
/// GL thread only. After the context is lost (AssetCachePool::release()) a program does nothing.
class ORV_API ShaderProgram : public Shared
{
public:
    using Ptr = SharedPtr<ShaderProgram>;

    ORV_CLASS_NAME("ShaderProgram")

    /// Learns the uniforms and attributes of an allocated, linked program and gives each sampler its units,
    /// counted from 0 in the order of the active uniforms.
    explicit ShaderProgram(const SharedPtr<detail::ProgramResource>& resource);
    ~ShaderProgram() override;

    /// GL name; 0 without a live GL program.
    unsigned getId() const;

    /// Identifies this program for as long as the process lives.
    uint64_t getRevision() const { return m_revision; }

    int getUniformCount() const { return int(m_uniforms.size()); } ///< Of active uniforms.

    /// The GLSL name up to its first "[". The text lives as long as the program; null for a bad index (logged).
    const char* getUniformInstanceName(int index) const;

    /// The name of the property that feeds the uniform; empty at first, null for a bad index (logged).
    const char* getUniformPropertyName(int index) const;

    /// @param name  copied; null counts as empty.
    void setUniformPropertyName(int index, const char* name);

    /// Sets the value that the uniform takes until the next call; null clears it. A bad index is logged.
    void setUniformPropertyValue(int index, const SharedPtr<ShaderUniformBase>& value);

    /// Whether a uniform takes the property of this name. The GLSL name does not count.
    bool uniformExists(const char* propertyName) const;

    /// uniformExists("M_MIRROR_TEXTURE"), answered without comparing names.
    bool usesMirrorTexture() const { return m_usesMirrorTexture; }

    /// uniformExists("J_WORLD"), likewise.
    bool usesJoints() const { return m_usesJoints; }

    /// Whether a uniform takes T_MODEL, T_MODEL_VIEW or T_MODEL_VIEW_PROJECTION, likewise. Without one, nothing that is
    /// drawn depends on where its node is.
    bool usesModelTransform() const { return m_usesModelTransform; }

    /// Looks the property names up in the context, unless that was done before and neither the context nor its
    /// set of properties is another one by now. A name that is not found keeps what it had.
    void link(RenderContext& context);

    /// Makes the program current and sends what changed. Draw path.
    void enable(RenderContext& context) { enable(context, nullptr, m_sources); }

    /// @param values   null, or getUniformCount() borrowed pointers, null where there is no value.
    /// @param sources  the caller's memory of what was found out for these values; its revision is to be set to 0
    ///                 when values changes.
    void enable(RenderContext& context, const ShaderUniformBase* const* values,
                detail::UniformSources& sources);

    /// The same without the transforms of sources, which the caller sends by sendTransform() for each draw.
    /// @return sources; null, with nothing done, without a live GL program.
    const detail::UniformSources* prepare(RenderContext& context, const ShaderUniformBase* const* values,
                                          detail::UniformSources& sources);

    /// Sends the matrix to the current program, which has this uniform, unless it was sent last.
    /// @param uniform  of a source with a DrawTransform of this type.
    static void sendTransform(detail::DrawnUniform& uniform, const Matrix4f& matrix);
    static void sendTransform(detail::DrawnUniform& uniform, const Matrix3f& matrix);
    /// Sends what the property holds that has the transform, if a uniform takes it.
    static void sendHeldTransform(const detail::UniformSources& sources, detail::DrawTransform transform);

    /// The plain form: sends what changed to the current GL program, which must be this one.
    void enableUniforms();

    /// The plain form: points the vertex attributes at the buffer. An attribute that the buffer lacks reads
    /// (1, 1, 1, 1).
    void bind(VertexBuffer& buffer);

    /// The same through the context's memory of bindings. Draw path; see RenderContext::DrawScope.
    void bind(RenderContext& context, VertexBuffer& buffer);

    /// Asks GL whether the program can run in the current GL state; the GL's reason is logged when it cannot.
    bool isValid() const;

    /// @param binary  receives a block made with new[], the caller's to delete[].
    /// @return false, outputs untouched, when there is no binary to be had.
    bool getBinary(unsigned int& length, unsigned int& format, char*& binary) const;

    /// The program that was enabled last through the context, if it is still alive and GL still uses it; else
    /// null. Asks GL, so it is no part of the draw path.
    static ShaderProgram* getCurrent(const RenderContext& context);

    detail::DrawMark& getDrawMark() const { return m_drawMark; } ///< the renderer's

private:
    using Uniform = detail::DrawnUniform;

    struct UniformNames
    {
        std::string instance;
        std::string property;
    };

    ORV_LOCAL void getUniforms();
    ORV_LOCAL void getAttributes();
    ORV_LOCAL bool indexInRange(int index) const;
    ORV_LOCAL void addUniform(const char* name, int location, int size, unsigned glType, int& nextUnit);
    ORV_LOCAL void setSamplerUnits() const;
    ORV_LOCAL static void sendIfNew(const detail::UniformSources::Value& value);
    ORV_LOCAL static void sendVector(const detail::UniformSources::Value& value);
    ORV_LOCAL static Vector4f* getSentVector(const Uniform& uniform, const ShaderUniformBase& source);
    ORV_LOCAL bool isReady(const RenderContext& context, const detail::UniformSources& sources) const;
    ORV_LOCAL bool makeReady(RenderContext& context, const ShaderUniformBase* const* values,
                             detail::UniformSources& sources);
    ORV_LOCAL void linkAnew(RenderContext& context);
    ORV_LOCAL void resolve(const ShaderUniformBase* const* values, detail::UniformSources& sources);

    uint64_t m_linkedRevision = 0; ///< the context's property revision at the last link
    uint64_t m_sourcesRevision;    ///< changes with every linked or set value
    uint64_t m_readyRevision = 0;  ///< the last of all revisions when all values had been sent
    uint64_t m_readyUniforms = 0;  ///< UniformSources::ownUniforms of that time
    SharedPtr<detail::ProgramResource> m_resource;
    std::vector<Uniform> m_uniforms;
    std::vector<UniformNames> m_names; ///< of m_uniforms
    detail::UniformSources m_sources;  ///< without an appearance
    std::vector<detail::ProgramAttrib> m_attribs;
    SharedPtr<detail::ProgramHandle> m_handle;
    uint64_t m_revision;
    mutable detail::DrawMark m_drawMark;
    bool m_usesMirrorTexture = false;
    bool m_usesJoints = false;
    bool m_usesModelTransform = false;
};

} // namespace orv
