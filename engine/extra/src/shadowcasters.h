#pragma once

#include "shadowprograms.h"

#include "orv/appearance.h"
#include "orv/matrix.h"
#include "orv/sharedptr.h"

#include <cstdint>
#include <unordered_map>
#include <vector>

namespace orv
{

class RenderContext;
class Solid;

namespace detail
{

struct ShadowView;

/// Draws solids into a shadow map, with a second material for each material that draws distances.
class ShadowCasters
{
public:
    explicit ShadowCasters(const ShadowPrograms& programs);

    /// Call it before the solids of a frame.
    void begin(const ShadowView& view);
    /// @param solid  with a mesh, and a material with a program.
    void draw(RenderContext& context, Solid& solid);
    /// Drops materials that the frame did not use.
    void finish();

private:
    /// A value that the map's material copies from the solid's.
    struct Value
    {
        SharedPtr<ShaderUniformBase> from;
        SharedPtr<ShaderUniformBase> to;
        bool (*copy)(const ShaderUniformBase& from, ShaderUniformBase& to);
    };

    struct Caster
    {
        SharedPtr<ShaderProgram>
            program;           ///< the solid's; with the revision it tells whether this is up to date
        uint64_t revision = 0; ///< of the properties of the solid's material
        uint64_t frame = 0;
        SharedPtr<Appearance> material; ///< empty without a program for it
        SharedPtr<ShaderUniform<Matrix4f>> model;
        SharedPtr<ShaderUniform<int>> jointCount; ///< empty without joints, as are these
        SharedPtr<ShaderUniform<Matrix4f>> joints;
        SharedPtr<ShaderUniform<float>> weightFilled;
        std::vector<Value> values;
    };

    Caster& find(const Appearance& appearance);
    void make(const Appearance& appearance, Caster& caster) const;
    void addValues(const Appearance& appearance, Caster& caster) const;

    const ShadowPrograms& m_programs;
    std::unordered_map<const Appearance*, Caster> m_casters;
    SharedPtr<ShaderUniform<Matrix4f>> m_clip; ///< the same for all
    uint64_t m_frame = 0;
    size_t m_seen = 0; ///< in this frame
    const ShadowView* m_view = nullptr;
};

} // namespace detail
} // namespace orv
