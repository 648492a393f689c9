#pragma once

#include "orv/detail/drawcall.h"
#include "orv/matrix.h"
#include "orv/scenenode.h"
#include "orv/sharedptr.h"

namespace orv
{

class Appearance;
class Mesh;
class RenderContext;
class ShaderProgram;

/// A mesh in the scene, drawn with an appearance, perhaps skinned by joints.
class ORV_API Solid : public SceneNode
{
public:
    ORV_CLASS_NAME("Solid")
    using Ptr = SharedPtr<Solid>;
    static constexpr NodeType NODE_TYPE = 1; ///< What getNodeType() says of a solid.

    static constexpr int MAX_JOINTS_PER_VERTEX = 4; ///< More are clamped.
    /// The joint matrices that reach a shader; further joints are kept but have no effect.
    static constexpr int MAX_JOINTS = 20;

    /// A node that moves vertices.
    struct JointAttachment
    {
        SharedPtr<SceneNode> joint;                ///< empty when unbound
        Matrix4f inverseBind = Matrix4f::IDENTITY; ///< mesh space, after the bind shape, to joint space
    };

    Solid();
    /// Shares both; where one is empty, nothing is drawn.
    Solid(const SharedPtr<Mesh>& mesh, const SharedPtr<Appearance>& appearance);
    ~Solid() override;

    NodeType getNodeType() const override { return NODE_TYPE; }
    void accept(SceneNodeVisitor& visitor) override;

    const SharedPtr<Mesh>& getMesh() const { return m_mesh; } ///< What is drawn, and how; may be empty.
    void setMesh(const SharedPtr<Mesh>& mesh);
    const SharedPtr<Appearance>& getAppearance() const { return m_appearance; }
    void setAppearance(const SharedPtr<Appearance>& appearance);

    /// Whether anything about joints was ever set.
    bool hasSkin() const { return m_hasSkin; }
    int getJointsPerVertex() const;
    /// @param count  0 to 4; larger is clamped with a warning, negative counts as 0.
    void setJointsPerVertex(int count);

    /// The transform of the mesh into the space in which the joints were bound; identity at first.
    const Matrix4f& getBindShapeTransform() const;
    void setBindShapeTransform(const Matrix4f& transform);

    /// Adds the next joint (index 0 first, as the vertices' joint numbers count).
    ///
    /// The solid stays bound to the joint for as long as the joint lives, wherever the two are moved. It keeps
    /// the joint alive, unless this or another solid with joints is at or below the joint: those could keep each
    /// other alive for ever, so such a joint is its tree's alone. That may change with every move.
    /// @param joint  empty leaves the joint unbound.
    /// @param inverseBind  inverse of the joint's world transform in the pose of binding.
    /// One error is logged when the count first exceeds MAX_JOINTS.
    void attachJoint(const SharedPtr<SceneNode>& joint, const Matrix4f& inverseBind);
    int getJointCount() const;
    /// @param i  0 to getJointCount() - 1.
    /// @return with the joint empty when none was given or it is destroyed.
    JointAttachment getJoint(int i) const;

    /// Mesh space to world space for one joint: its world transform * inverse bind * bind shape. An unbound
    /// joint is in its rest pose: this solid's world transform * bind shape.
    Matrix4f calculateJointTransform(const JointAttachment& attachment) const;
    Matrix4f getJointTransform(int i) const;

    /// Draws the mesh with the solid's own appearance; nothing without one. GL thread only.
    void draw(RenderContext& context);

    /// Enables the appearance and draws the mesh. The winding sent is the appearance's, turned when the mesh is
    /// mirrored on its way to the world, so that front faces stay front faces: by the world transform or, where
    /// the program takes J_WORLD and there are joints, by most of the joints' transforms.
    /// An appearance without a program draws with the program that is current; with none current, nothing is
    /// drawn. GL thread only.
    void draw(RenderContext& context, Appearance& appearance);

    /// Draw path: binds the vertices and indices of the mesh, which is there, but for what is bound already.
    /// @return how to draw the mesh, any number of times until something else is bound.
    detail::DrawCall bindMesh(RenderContext& context, ShaderProgram& program) const;

    /// Whether draw() turns the winding for this program, which may be null.
    bool turnsWinding(const ShaderProgram* program) const
    {
        return m_hasSkin ? turnsSkinWinding(program) : getWorldMirrored();
    }

private:
    ORV_LOCAL detail::SolidSkin* makeSkin();
    bool turnsSkinWinding(const ShaderProgram* program) const;
    ORV_LOCAL bool isSkinMirrored() const;
    ORV_LOCAL Matrix4f calculateJointTransform(const SceneNode* joint, const Matrix4f& inverseBind) const;

    SharedPtr<Mesh> m_mesh;
    SharedPtr<Appearance> m_appearance;
};

} // namespace orv
