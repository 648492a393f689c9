#pragma once

#include "orv/detail/drawcall.h"
#include "orv/detail/modelprojection.h"
#include "orv/matrix.h"

#include <cstddef>
#include <cstdint>

namespace orv
{

class Appearance;
class Mesh;
class RenderContext;
class ShaderProgram;
class Solid;

namespace detail
{

struct RendererProperties;
struct UniformSources;

/// Draws a list of solids for one eye. From solid to solid it checks only values that may have changed: the same
/// material and mesh as before need no calls.
class SolidPainter
{
public:
    /// @param context, properties, view  borrowed.
    SolidPainter(RenderContext& context, const RendererProperties& properties, const Matrix4f& view,
                 const Matrix4f& projection);

    /// Draws in order. Afterwards the transform properties have the last solid's values.
    /// @param solids  each with an appearance and a program.
    void draw(Solid* const* solids, size_t count);

private:
    bool takeMaterial(const Solid& solid);
    void publishJoints(const Solid& solid);
    bool takeMesh(const Solid& solid);
    void sendTransforms(const Solid& solid) const;
    void publishTransforms(const Solid& solid) const;
    Matrix4f place(const Solid& solid) const;
    Matrix4f project(const Solid& solid) const;

    RenderContext& m_context;
    const RendererProperties& m_properties;
    const Matrix4f& m_view;
    const Matrix4f m_projection;
    const ModelProjection m_modelProjection;

    // Of the previous solid; null forces all checks.
    const void* m_material = this; ///< this forces all checks: null is that of a solid without one
    const ShaderProgram* m_program = nullptr;
    const Mesh* m_mesh = nullptr; ///< bound for m_program
    uint64_t m_revision = 0;      ///< the process's last revision when its material was ready
    bool m_turnsWinding = false;
    bool m_hadJoints;
    const UniformSources* m_sources = nullptr;
    DrawCall m_call; ///< of m_mesh
};

} // namespace detail
} // namespace orv
