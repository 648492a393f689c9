#pragma once

#include "orv/angle.h"
#include "orv/matrix.h"
#include "orv/scenenode.h"

#include <cstdint>

namespace orv
{

/// A point of view: looks along its -z axis with +y up, in perspective unless told otherwise.
///
/// Stereo is on while the eye separation is not 0. Distances are in the camera's own units (a scaled camera
/// scales them).
class ORV_API Camera : public SceneNode
{
public:
    ORV_CLASS_NAME("Camera")
    using Ptr = SharedPtr<Camera>;
    static constexpr NodeType NODE_TYPE = 2; ///< What getNodeType() says of a camera.

    /// How the camera looks: with or without perspective.
    enum class ProjectionType : int32_t
    {
        ORTHOGRAPHIC = 0,
        PERSPECTIVE = 1
    };

    Camera() = default;
    explicit Camera(const char* name) : SceneNode(name) {} ///< The name is copied; it may be null.

    NodeType getNodeType() const override { return NODE_TYPE; }
    void accept(SceneNodeVisitor& visitor) override;

    ProjectionType getProjectionType() const { return m_projectionType; } ///< Perspective at first.
    void setProjectionType(ProjectionType type) { m_projectionType = type; }

    /// The angle that spans the shorter side of the view, in perspective.
    const Anglef& getFieldOfView() const { return m_fieldOfView; }
    void setFieldOfView(const Anglef& fieldOfView); ///< warns on an orthographic camera, and stores

    /// What the view spans from left to right, orthographic.
    float getWidth() const { return m_width; }
    void setWidth(float width); ///< warns on a perspective camera, and stores

    /// Distances of the clipping planes from the eye, in world units.
    float getNear() const { return m_near; }
    void setNear(float distance) { m_near = distance; }
    float getFar() const { return m_far; }
    void setFar(float distance) { m_far = distance; }

    /// The distance at which both eyes' pictures coincide; 0 or not finite makes the eyes look in parallel.
    float getStereoFocalDistance() const { return m_stereoFocalDistance; }
    /// The distance between the eyes; 0 is mono.
    float getStereoEyeSeparation() const { return m_stereoEyeSeparation; }
    /// Stores both; warns on an orthographic camera if the separation is not 0.
    void setStereo(float focalDistance, float eyeSeparation);

    /// Eye space to clip space. A perspective camera with near 0 gets near = far / 1000, and one with near
    /// equal to far gets 1 and 1000: stored in the camera, with a warning.
    /// @param aspect  width / height of the view; 0 or not finite counts as 1.
    void getProjection(Matrix4f* out, float aspect);

    /// The eyes' projections: off-axis frustums that meet at the focal distance, or twice the plain
    /// projection when orthographic. Clipping distances are put right as by getProjection(), but for this
    /// call only and without a warning.
    void getStereoProjection(Matrix4f* left, Matrix4f* right, float aspect) const;

    /// The eyes' world transforms: the camera's, moved along its world x axis by half the separation, the
    /// left eye towards -x.
    void getStereoWorldTransform(Matrix4f* left, Matrix4f* right) const;

private:
    ORV_LOCAL Matrix4f calculateProjection(float aspect, float nearDistance, float farDistance) const;

    ProjectionType m_projectionType = ProjectionType::PERSPECTIVE;
    Anglef m_fieldOfView = Anglef::fromDegrees(60.0f);
    float m_width = 2.0f;
    float m_near = 0.1f;
    float m_far = 100.0f;
    float m_stereoFocalDistance = 50.0f;
    float m_stereoEyeSeparation = 0.0f;
};

} // namespace orv
