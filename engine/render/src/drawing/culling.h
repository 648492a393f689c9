#pragma once

#include "frustum.h"

#include "scene/scenewalk.h"

#include "orv/detail/framelist.h"
#include "orv/scenenodevisitor.h"

#include <cstddef>
#include <cstdint>

namespace orv
{

struct FlagMask;
class Mesh;
class Solid;

namespace detail
{

struct Eye;

/// Whether an eye cannot see a solid, as far as its bounds tell.
bool hides(const Frustum& frustum, const Solid& solid);

/// Leaves out invisible solids: in the walk if no eye sees them, and from the list to be drawn for each of several
/// eyes.
///
/// The view of a mirror is known only after the walk. So if the last frame had mirrors, the whole scene is walked; if a
/// mirror appears, the scene is walked twice.
class Culling : private SceneNodeVisitor, private WalkGuide
{
public:
    /// @param renderer  borrowed: visits solids that may be visible.
    explicit Culling(SceneNodeVisitor& renderer);

    void begin(const Eye* eyes, int eyeCount);
    void walk(SceneNode& scene, const FlagMask& renderFlags, const FlagMask& recursiveFlags);
    /// @param hasMirrors  the walk has found mirrors.
    /// @return false if the walk left out solids that mirrors may show: walk again.
    bool finish(bool hasMirrors);

    /// Those of the solids that one eye may see, in their order.
    /// @param count  in: of solids; out: of the result.
    /// @return valid until the next call.
    Solid* const* select(Solid* const* solids, size_t& count, const Matrix4f& view,
                         const Matrix4f& projection);

    /// Whether one eye cannot see a solid.
    bool hides(const Solid& solid, const Matrix4f& view, const Matrix4f& projection);

    /// Draws that were left out since begin().
    uint32_t getCount() const { return m_count; }

private:
    void visit(SceneNode* node) override;
    void visit(Solid* solid) override;
    void visit(Camera* camera) override;
    void visit(Light* light) override;
    SceneNodeVisitor* choose(const SceneNode& node) override;

    void visitDoubtful(Solid* solid);

    SceneNodeVisitor& m_renderer;
    Frustum m_frustums[2];
    int m_eyeCount = 0;
    uint32_t m_count = 0;
    bool m_hasMirrors = false;
    FrameList<Solid*> m_selected;
};

} // namespace detail
} // namespace orv
