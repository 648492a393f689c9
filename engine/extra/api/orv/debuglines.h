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

/// Lines that show what cannot be seen: places, boxes, axes, joints, what a camera sees. All of them are one GL draw, over
/// a frame.
///
///     const auto lines = makeShared<DebugLines>(*pool);
///     lines->addAxes(node->getWorldTransform(), 0.5f);
///     block.render();
///     lines->draw(*context, *camera);
///
/// Lines are copied as things stand when they are added, in world space, one pixel wide; what moves is added again after
/// clear(). The alpha of a colour is its opacity; components count from 0 to 1.
/// A lost context takes the program along: make other lines for the next one.
/// Threads: draw() and the last release belong to the GL thread; no locks.
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
    /// From one colour to another.
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

    /// From each node below top to its parent: the bones of a skeleton, or how a tree hangs together.
    void addSkeleton(const SceneNode& top, const Colour4f& colour);

    /// From each joint of a skinned solid to the next one above it that is a joint of it too.
    void addJoints(const Solid& solid, const Colour4f& colour);

    /// What a camera sees: twelve edges, near to far.
    /// @param camera  clipping distances that are no good are put right, see Camera::getProjection().
    /// @param aspect  width / height of the view.
    void addFrustum(Camera& camera, float aspect, const Colour4f& colour);

    int getLineCount() const { return int(m_vertices.size() / 2); } ///< Lines added since clear().
    void clear();                                                   ///< Takes all lines out again.

    /// Whether what lies before a line in the depth buffer hides it, as at first, or lines go over everything. Depth is
    /// never written.
    void setDepthTested(bool tested);

    /// Draws into the viewport as a renderer would for this camera, in stereo to both halves: right after the block, with
    /// the target enabled if it had one. One GL draw for each eye, none without lines.
    ///
    /// The vertices have one GL buffer, which goes with the pool's flush() after the lines. As long as nothing is added or
    /// taken out, nothing is copied or made again, and as long as their number stays, nothing is allocated.
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
