#pragma once

#include "orv/colour.h"
#include "orv/export.h"
#include "orv/matrix.h"
#include "orv/shaderuniform.h"
#include "orv/shared.h"
#include "orv/sharedptr.h"
#include "orv/vector.h"

#include <cstdint>
#include <vector>

namespace orv
{

class AssetCachePool;
class Camera;
class RenderContext;
class SceneNode;
class Solid;
class VertexBuffer;
class VertexBufferCache;

/// Lines for debugging: boxes, axes, grids, skeletons, joints, camera frustums. One GL draw for all, over a frame.
///
///     const auto lines = makeShared<DebugLines>(*pool);
///     lines->addAxes(node->getWorldTransform(), 0.5f);
///     block.render();
///     lines->draw(*context, *camera);
///
/// Lines are added in world space, one pixel wide, and do not follow their objects: after a movement, clear() and add
/// them again. The alpha of a colour is its opacity; components count from 0 to 1. After a lost context, make a new
/// object: its program is lost. Threads: draw() and the last release belong to the GL thread; no locks.
class ORV_API DebugLines : public Shared
{
public:
    ORV_CLASS_NAME("DebugLines")
    using Ptr = SharedPtr<DebugLines>;

    /// @param pool  for the shader program; its cache of vertex buffers is held as well.
    explicit DebugLines(AssetCachePool& pool);
    ~DebugLines() override;

    /// Adds a line in the world.
    void addLine(const Vector3f& from, const Vector3f& to, const Colour4f& colour);
    /// A line from one colour to another.
    void addLine(const Vector3f& from, const Colour4f& fromColour, const Vector3f& to,
                 const Colour4f& toColour);

    /// Twelve edges. @param transform  from the space that low and high are in to the world.
    void addBox(const Vector3f& low, const Vector3f& high, const Matrix4f& transform, const Colour4f& colour);

    /// x in red, y in green, z in blue. @param length  in the space that transform leads from.
    void addAxes(const Matrix4f& transform, float length);

    /// Squares in the plane y = 0 around the origin.
    /// @param cells    along each side, up to 1000.
    /// @param spacing  of the lines, in the space that transform leads from.
    void addGrid(const Matrix4f& transform, int cells, float spacing, const Colour4f& colour);

    /// Lines from each node below top to its parent: the bones of a skeleton, or a node hierarchy.
    void addSkeleton(const SceneNode& top, const Colour4f& colour);

    /// From each joint of a skinned solid to the next one above it that is a joint of it too.
    void addJoints(const Solid& solid, const Colour4f& colour);

    /// A camera's view volume: twelve edges, near to far.
    /// @param camera  invalid clipping distances are corrected, see Camera::getProjection().
    /// @param aspect  width / height of the view.
    void addFrustum(Camera& camera, float aspect, const Colour4f& colour);

    int getLineCount() const { return int(m_vertices.size() / 2); } ///< Lines added since clear().
    void clear();                                                   ///< Removes all lines.

    /// Whether nearer surfaces hide lines (the default), or lines are drawn over everything. Depth is never written;
    /// lines as far away as a surface are seen.
    void setDepthTested(bool tested);

    /// Draws into the viewport with this camera, in stereo into both halves. Call it after the block, with the block's
    /// target enabled if it has one. One GL draw for each eye, none without lines.
    ///
    /// The vertices have one GL buffer, which the pool's flush() deletes after the lines. Unchanged lines are not
    /// uploaded again; an unchanged number of lines needs no allocation.
    void draw(RenderContext& context, Camera& camera);

private:
    struct Vertex
    {
        Vector3f place;
        uint8_t colour[4];
    };

    ORV_LOCAL bool copyVertices();
    ORV_LOCAL bool makeBuffer(const unsigned char* data, unsigned size);
    ORV_LOCAL void setMesh();

    std::vector<Vertex> m_vertices;       ///< two for each line
    bool m_isCopied = true;               ///< the buffer holds them
    SharedPtr<VertexBufferCache> m_cache; ///< the pool's
    SharedPtr<VertexBuffer> m_buffer;
    SharedPtr<Solid> m_solid;
    SharedPtr<ShaderUniform<Matrix4f>> m_transform; ///< the appearance's, from world to clip space
};

} // namespace orv
