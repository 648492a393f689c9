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

/// Keeps from a renderer what it cannot see: in the walk where there is one eye, or two which both do not see it, and in
/// the list that is about to be drawn where it is drawn for several.
///
/// What a mirror may show is known only when the walk has found it. So a scene that had mirrors in the frame before is
/// walked as a whole; one that turns out to have one is walked twice.
class Culling : private SceneNodeVisitor, private WalkGuide
{
public:
    /// @param renderer  borrowed: visits what may be seen.
    explicit Culling(SceneNodeVisitor& renderer);

    void begin(const Eye* eyes, int eyeCount);
    void walk(SceneNode& scene, const FlagMask& renderFlags, const FlagMask& recursiveFlags);
    /// @param hasMirrors  the walk has found some.
    /// @return false if the walk has left out what these may show: it is to be done again.
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
